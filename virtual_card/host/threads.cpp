// Starts threads that block signals and use normal scheduling.
#include "threads.h"

#include <pthread.h>

#include <csignal>

namespace virtual_card {
namespace {

/// While an object of this class exists, threads that its creator starts have all signals blocked except
/// those of their own faults.
class SignalsBlocked {
 public:
  SignalsBlocked() {
    sigset_t all;
    sigfillset(&all);
    for (const int fault : {SIGSEGV, SIGBUS, SIGFPE, SIGILL, SIGTRAP}) sigdelset(&all, fault);
    pthread_sigmask(SIG_SETMASK, &all, &before_);
  }
  ~SignalsBlocked() { pthread_sigmask(SIG_SETMASK, &before_, nullptr); }
  SignalsBlocked(const SignalsBlocked &) = delete;
  SignalsBlocked &operator=(const SignalsBlocked &) = delete;

 private:
  sigset_t before_{};
};

}  // namespace

std::thread start_thread(std::function<void()> work) {
  const SignalsBlocked blocked;
  return std::thread([work = std::move(work)] {
    const sched_param normal{};
    pthread_setschedparam(pthread_self(), SCHED_OTHER, &normal);
    work();
  });
}

}  // namespace virtual_card
