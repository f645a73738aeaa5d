/**
 * @file worker_pool.h
 * Threads that share out numbered jobs.
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
  /// `threads` at most work on a job list, the caller of run() included. The others begin with the first
  /// list; where they cannot, those there are do it all.
  explicit WorkerPool(unsigned threads) : max_threads_(threads) {}
  ~WorkerPool() { stop(); }
  WorkerPool(const WorkerPool &) = delete;
  WorkerPool &operator=(const WorkerPool &) = delete;

  /// Does job(0) to job(count - 1), in any order, and returns when all are done. What a job throws is
  /// thrown then.
  void run(std::size_t count, const std::function<void(std::size_t)> &job);
  /// Ends and joins the threads, until the next run(). Calling it twice is harmless.
  void stop();

 private:
  void grow();
  void serve();
  /// Takes jobs until none is left; the lock is held on entry and on return.
  void work(std::unique_lock<std::mutex> &lock);

  std::mutex mutex_;  ///< guards everything but the threads
  std::condition_variable wanted_;
  std::condition_variable finished_;
  const std::function<void(std::size_t)> *job_ = nullptr;
  std::size_t next_ = 0;
  std::size_t count_ = 0;
  std::size_t busy_ = 0;
  bool ending_ = false;
  std::exception_ptr failure_;  ///< what a job of this run() threw
  unsigned max_threads_;
  std::vector<std::thread> threads_;
};

}  // namespace virtual_card

#endif
