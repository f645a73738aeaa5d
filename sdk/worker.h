/**
 * @file worker.h
 * A thread with one owner, who starts and joins it.
 */
#ifndef ZV_WORKER_H
#define ZV_WORKER_H

#include <pthread.h>

#include <mutex>

namespace zarvo {

/// A thread of the SDK. Its owner starts and joins it; the thread itself may try to, and is refused.
class Worker {
 public:
  using Routine = void *(*)(void *);

  /// Starts the thread, after joining one that has ended but was never joined. False when there is
  /// no thread to be had, or when the caller is the old thread itself.
  bool start(Routine routine, void *argument);

  /// Waits for the thread and keeps its exit value. True when there is nothing to join; false when
  /// the join fails. On the thread itself it fails at once, and the thread stays to be joined later.
  bool join(void *&result);

 private:
  std::mutex mutex_;  ///< guards the two below; not held while waiting for the thread
  pthread_t id_{};
  bool joinable_ = false;
};

/// Makes the calling thread cancellable, deferred. Null on success, else a text for the exit value.
void *make_cancellable();

}  // namespace zarvo

#endif
