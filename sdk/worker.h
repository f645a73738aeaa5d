/**
 * @file worker.h
 * A thread that its owner starts and joins.
 */
#ifndef ZV_WORKER_H
#define ZV_WORKER_H

#include <pthread.h>

namespace zarvo {

/// A thread of the SDK. It takes no signals except those of its own faults, so that a signal handler of the
/// host never runs inside it. start() and join() refuse when the thread calls them on itself.
class Worker {
 public:
  using Routine = void *(*)(void *);

  /// Starts the thread. First joins a thread that was started before and not joined. Returns false when no
  /// thread can be created, or when the caller is the earlier thread.
  bool start(Routine routine, void *argument);

  /// Waits for the thread and stores its exit value in `result`. Returns true also when there is no thread to
  /// join, false when the join fails. Returns false at once when the thread itself is the caller; the thread
  /// can still be joined later.
  bool join(void *&result);

 private:
  pthread_mutex_t mutex_ =
      PTHREAD_MUTEX_INITIALIZER;  ///< guards id_ and joinable_; not held while waiting for the thread
  pthread_t id_{};
  bool joinable_ = false;
};

/// Gives the calling thread deferred cancellation. Returns null on success, else a text to use as the
/// thread's exit value.
void *make_cancellable();

}  // namespace zarvo

#endif
