// A pool of threads that do numbered jobs.
#include "worker_pool.h"

#include <utility>

#include "threads.h"

namespace virtual_card {

void WorkerPool::grow() {
  try {
    threads_.reserve(max_threads_);
    while (threads_.size() + 1 < max_threads_) threads_.push_back(start_thread([this] { serve(); }));
  } catch (const std::exception &) {
    // Go on with the threads there are; the next run() tries again.
  }
}

void WorkerPool::stop() {
  {
    const std::lock_guard lock(mutex_);
    ending_ = true;
  }
  wanted_.notify_all();
  for (std::thread &thread : threads_) thread.join();
  threads_.clear();
  ending_ = false;
}

void WorkerPool::run(std::size_t count, const std::function<void(std::size_t)> &job) {
  if (count > 1 && threads_.size() + 1 < max_threads_) grow();
  std::unique_lock lock(mutex_);
  job_ = &job;
  next_ = 0;
  count_ = count;
  if (count > 1) wanted_.notify_all();
  work(lock);
  finished_.wait(lock, [this] { return busy_ == 0; });
  job_ = nullptr;
  if (failure_) std::rethrow_exception(std::exchange(failure_, nullptr));
}

void WorkerPool::serve() {
  std::unique_lock lock(mutex_);
  while (true) {
    wanted_.wait(lock, [this] { return ending_ || next_ < count_; });
    if (ending_) return;
    work(lock);
  }
}

void WorkerPool::work(std::unique_lock<std::mutex> &lock) {
  while (next_ < count_) {
    const std::size_t mine = next_++;
    ++busy_;
    lock.unlock();
    std::exception_ptr failure;
    try {
      (*job_)(mine);
    } catch (...) {
      failure = std::current_exception();
    }
    lock.lock();
    if (failure) failure_ = failure;
    if (--busy_ == 0 && next_ == count_) finished_.notify_all();
  }
}

}  // namespace virtual_card
