/**
 * @file worker_pool.h
 * A pool of threads that do numbered jobs.
 */
#ifndef VIRTUAL_CARD_WORKER_POOL_H
#define VIRTUAL_CARD_WORKER_POOL_H

#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <exception>
#include <functional>
#include <mutex>
#include <thread>
#include <vector>

namespace virtual_card {

class WorkerPool {
 public:
  /// At most `threads` threads work on a job list, the caller of run() included. The other threads start with
  /// the first run() of more than one job; if some cannot be started, the rest do the work.
  explicit WorkerPool(unsigned threads) : max_threads_(threads) {}
  ~WorkerPool() { stop(); }
  WorkerPool(const WorkerPool &) = delete;
  WorkerPool &operator=(const WorkerPool &) = delete;

  /// Does job(0) to job(count - 1), in any order, and returns when all are done. If a job throws, rethrows
  /// that exception at the end; of several, the last.
  void run(std::size_t count, const std::function<void(std::size_t)> &job);
  /// Ends and joins the threads; the next run() starts them again. May be called twice.
  void stop();

 private:
  void grow();
  void serve();
  /// Does jobs until none is left. The lock is held on entry and on return.
  void work(std::unique_lock<std::mutex> &lock);

  std::mutex mutex_;  ///< guards all members except max_threads_ and threads_
  std::condition_variable wanted_;
  std::condition_variable finished_;
  const std::function<void(std::size_t)> *job_ = nullptr;
  std::size_t next_ = 0;
  std::size_t count_ = 0;
  std::size_t busy_ = 0;
  bool ending_ = false;
  std::exception_ptr failure_;  ///< exception of a job of the current run()
  unsigned max_threads_;
  std::vector<std::thread> threads_;
};

}  // namespace virtual_card

#endif
