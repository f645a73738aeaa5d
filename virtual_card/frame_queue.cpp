// A bounded queue between the card's encoders and the host's reads.
#include <algorithm>
#include <utility>

#include "frame_queue.h"
#include "host/monotonic_time.h"

namespace virtual_card {

FrameQueue::FrameQueue(std::size_t capacity) : capacity_(capacity) {}

bool FrameQueue::push(ReadyFrame frame) {
  {
    const std::lock_guard lock(mutex_);
    const std::size_t size = frame.area.size();
    const bool fits = bytes_ + size <= capacity_ && frames_.size() < max_frames_;
    if (fits) {
      frames_.push_back(std::move(frame));
      bytes_ += size;
    }
    ++counters_.made;
    if (!fits) {
      if (counts_unread_) ++session_unread_;
      ++counters_.lost;
      return false;
    }
  }
  filled_.notify_one();
  return true;
}

std::optional<ReadyFrame> FrameQueue::pop(std::chrono::microseconds wait) {
  std::unique_lock lock(mutex_);
  read_ = true;
  if (frames_.empty() && wait.count() > 0) {
    const auto wakes = wakes_;
    const auto until = monotonic_now() + wait;
    while (frames_.empty() && wakes == wakes_ && monotonic_now() < until) filled_.wait_until(lock, until);
  }
  if (frames_.empty()) return {};
  std::optional<ReadyFrame> frame(std::move(frames_.front()));
  frames_.pop_front();
  bytes_ -= frame->area.size();
  ++counters_.delivered;
  return frame;
}

void FrameQueue::end_session() {
  {
    const std::lock_guard lock(mutex_);
    frames_.clear();
    bytes_ = 0;
    if (read_) unread_ += session_unread_;
    session_unread_ = 0;
    read_ = false;
    ++wakes_;
  }
  filled_.notify_all();
}

std::uint64_t FrameQueue::take_unread() {
  const std::lock_guard lock(mutex_);
  return std::exchange(unread_, 0);
}

void FrameQueue::count_unread(bool on) {
  const std::lock_guard lock(mutex_);
  counts_unread_ = on;
}

void FrameQueue::clear() {
  const std::lock_guard lock(mutex_);
  frames_.clear();
  bytes_ = 0;
}

void FrameQueue::passed() {
  const std::lock_guard lock(mutex_);
  ++counters_.made;
  ++counters_.delivered;
}

void FrameQueue::lost_after_all() {
  const std::lock_guard lock(mutex_);
  --counters_.delivered;
  ++counters_.lost;
}

void FrameQueue::limit_frames(std::optional<std::int64_t> frames) {
  const std::lock_guard lock(mutex_);
  max_frames_ = frames ? static_cast<std::size_t>(*frames) : ~std::size_t{0};
}

void FrameQueue::missed(std::uint64_t frames) {
  const std::lock_guard lock(mutex_);
  counters_.made += frames;
  counters_.lost += frames;
}

void FrameQueue::reset_counters() {
  const std::lock_guard lock(mutex_);
  counters_ = {};
  unread_ = session_unread_ = 0;
  read_ = false;
}

StreamCounters FrameQueue::counters() const {
  const std::lock_guard lock(mutex_);
  return counters_;
}

}  // namespace virtual_card
