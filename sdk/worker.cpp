// A thread that its owner starts and joins.
#include "worker.h"

namespace zarvo {

namespace {

// Exit values of threads. An exit value is a void pointer, so these texts cannot be const.
char cancel_state_failed[] = "ERROR:pthread_setcancelstate failed.\n";
char cancel_type_failed[] = "ERROR:pthread_setcanceltype failed.\n";

}  // namespace

bool Worker::start(Routine routine, void *argument) {
  void *result = nullptr;
  if (!join(result)) return false;
  const std::lock_guard lock(mutex_);
  joinable_ = pthread_create(&id_, nullptr, routine, argument) == 0;
  return joinable_;
}

bool Worker::join(void *&result) {
  std::unique_lock lock(mutex_);
  if (!joinable_) return true;
  if (pthread_equal(id_, pthread_self()) != 0) return false;
  joinable_ = false;
  const pthread_t id = id_;
  lock.unlock();
  return pthread_join(id, &result) == 0;
}

void *make_cancellable() {
  int old = 0;
  if (pthread_setcancelstate(PTHREAD_CANCEL_ENABLE, &old) != 0) return cancel_state_failed;
  if (pthread_setcanceltype(PTHREAD_CANCEL_DEFERRED, &old) != 0) return cancel_type_failed;
  return nullptr;
}

}  // namespace zarvo
