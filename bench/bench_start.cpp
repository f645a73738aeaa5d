// Measures the time from the start of the program until its dialog is shown (virtual card, offscreen), and
// compares it with that of an empty QDialog.
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>

#include "report.h"

extern char **environ;

namespace {

/// What the programs print is no part of the report.
posix_spawn_file_actions_t silent() {
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  for (const int fd : {STDOUT_FILENO, STDERR_FILENO})
    posix_spawn_file_actions_addopen(&actions, fd, "/dev/null", O_WRONLY, 0);
  return actions;
}

double start_ns(const char *program, bool card = true) {
  static const posix_spawn_file_actions_t actions = silent();
  // By its name alone, found by its folder: the list of libraries has no quoting for blanks.
  setenv("LD_LIBRARY_PATH", VIRTUAL_CARD_FOLDER, 1);
  card ? setenv("LD_PRELOAD", VIRTUAL_CARD_NAME, 1) : unsetenv("LD_PRELOAD");
  const auto before = std::chrono::steady_clock::now();
  char *const arguments[] = {const_cast<char *>(program), nullptr};
  pid_t child = 0;
  int status = -1;
  if (posix_spawn(&child, program, &actions, nullptr, arguments, environ) != 0) std::abort();
  waitpid(child, &status, 0);
  if (status != 0) std::abort();
  return std::chrono::duration<double, std::nano>(std::chrono::steady_clock::now() - before).count();
}

void start(benchmark::State &state) {
  setenv("QT_QPA_PLATFORM", "offscreen", 1);
  for (auto iteration : state) {
    (void)iteration;
    bench::compare(
        "start to the dialog shown, against an empty QDialog", 21, 1.60,
        [] { return start_ns(START_DIALOG); }, [] { return start_ns(START_EMPTY); });
    bench::note("the dialog's start", start_ns(START_DIALOG) / 1e6, "ms");
    bench::note("an empty QDialog's start, without a card in front of it", start_ns(START_EMPTY, false) / 1e6,
                "ms");
  }
}
BENCHMARK(start)->Iterations(1)->Unit(benchmark::kMillisecond);

}  // namespace
