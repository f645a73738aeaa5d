/**
 * @file worker.h
 * A thread with one owner, who starts and joins it.
 */
#ifndef ZV_WORKER_H
#define ZV_WORKER_H

#include <pthread.h>

namespace zarvo {

/// A thread of the SDK. Its owner calls start() and join() from one thread at a time.
class Worker {
 public:
  using Routine = void *(*)(void *);

  /// Starts the thread, after joining one that has ended but was never joined. False when there is
  /// no thread to be had, or when the caller is the old thread itself.
  bool start(Routine routine, void *argument);

  /// Waits for the thread and keeps its exit value. True when there is nothing to join; false when
  /// the join fails, as it does on the thread itself: it then stays to be joined later.
  bool join(void *&result);

 private:
  pthread_t id_{};
  bool joinable_ = false;
};

/// Makes the calling thread cancellable, deferred. Null on success, else a text for the exit value.
void *make_cancellable();

}  // namespace zarvo

#endif
