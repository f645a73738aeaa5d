// Ends a program by a signal at a moment of its own choice.
#include "stop_signal.h"

#include <signal.h>

#include <initializer_list>

std::atomic<bool> stopping{false};

void survive_write_errors() {
  signal(SIGXFSZ, SIG_IGN);
  signal(SIGPIPE, SIG_IGN);
}

void catch_stop_signals() {
  struct sigaction action {};
  action.sa_handler = [](int) { stopping = true; };
  action.sa_flags = SA_RESTART | static_cast<int>(SA_RESETHAND);
  for (const int number : {SIGHUP, SIGINT, SIGTERM}) {
    struct sigaction before {};
    sigaction(number, nullptr, &before);
    if (before.sa_handler != SIG_IGN) sigaction(number, &action, nullptr);
  }
}
