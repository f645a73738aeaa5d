// A thread that its owner starts and joins.
#include "worker.h"

#include <csignal>
#include <initializer_list>

namespace zarvo {

namespace {

// Exit values of threads. An exit value is a void pointer, so these texts cannot be const.
char cancel_state_failed[] = "ERROR:pthread_setcancelstate failed.\n";
char cancel_type_failed[] = "ERROR:pthread_setcanceltype failed.\n";

/// Creates a thread with all signals blocked except those of its own faults.
bool create_thread(pthread_t &id, Worker::Routine routine, void *argument) {
  sigset_t blocked;
  sigset_t before;
  sigfillset(&blocked);
  for (const int fault : {SIGSEGV, SIGBUS, SIGFPE, SIGILL, SIGTRAP}) sigdelset(&blocked, fault);
  pthread_sigmask(SIG_SETMASK, &blocked, &before);
  const bool created = pthread_create(&id, nullptr, routine, argument) == 0;
  pthread_sigmask(SIG_SETMASK, &before, nullptr);
  return created;
}

}  // namespace

bool Worker::start(Routine routine, void *argument) {
  void *result = nullptr;
  if (!join(result)) return false;
  pthread_mutex_lock(&mutex_);
  const bool created = joinable_ = create_thread(id_, routine, argument);
  pthread_mutex_unlock(&mutex_);
  return created;
}

bool Worker::join(void *&result) {
  pthread_mutex_lock(&mutex_);
  const pthread_t id = id_;
  const bool waiting = joinable_;
  const bool self = waiting && pthread_equal(id, pthread_self()) != 0;
  joinable_ = self;
  pthread_mutex_unlock(&mutex_);
  return !waiting || (!self && pthread_join(id, &result) == 0);
}

void *make_cancellable() {
  int old = 0;
  if (pthread_setcancelstate(PTHREAD_CANCEL_ENABLE, &old) != 0) return cancel_state_failed;
  if (pthread_setcanceltype(PTHREAD_CANCEL_DEFERRED, &old) != 0) return cancel_type_failed;
  return nullptr;
}

}  // namespace zarvo
