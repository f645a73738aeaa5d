#include "worker_pool.h"

namespace virtual_card {

WorkerPool::WorkerPool(unsigned threads) {
  for (unsigned i = 1; i < threads; ++i) threads_.emplace_back([this] { serve(); });
}

WorkerPool::~WorkerPool() {
  {
    const std::lock_guard lock(mutex_);
    ending_ = true;
  }
  wanted_.notify_all();
  for (std::thread &thread : threads_) thread.join();
}

void WorkerPool::run(std::size_t count, const std::function<void(std::size_t)> &job) {
  std::unique_lock lock(mutex_);
  job_ = &job;
  next_ = 0;
  count_ = count;
  if (count > 1) wanted_.notify_all();
  work(lock);
  finished_.wait(lock, [this] { return busy_ == 0; });
  job_ = nullptr;
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
    (*job_)(mine);
    lock.lock();
    if (--busy_ == 0 && next_ == count_) finished_.notify_all();
  }
}

}  // namespace virtual_card
