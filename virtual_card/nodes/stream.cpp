// The supply and the faults of a stream.
#include "stream.h"

#include <thread>

namespace virtual_card {
namespace {

constexpr std::size_t kMaxHeld = 4096;  // frames

}  // namespace

void Stream::supply(std::vector<ReadyFrame> frames, double rate, std::uint64_t limit) {
  const std::lock_guard lock(mutex_);
  frames_ = std::move(frames);
  rate_ = rate;
  next_ = 0;
  left_ = limit;
  unpaced_ = !frames_.empty() && rate == 0;
}

void Stream::clear_supply() {
  supply({}, 0, 0);
}

double Stream::pace() const {
  const std::lock_guard lock(mutex_);
  return frames_.empty() || left_ == 0 ? 0 : rate_;
}

const ReadyFrame *Stream::next_supplied() {
  if (left_ == 0 || frames_.empty()) return nullptr;
  --left_;
  const ReadyFrame *frame = &frames_[next_];
  next_ = (next_ + 1) % frames_.size();
  return frame;
}

void Stream::supply_due() {
  const std::lock_guard lock(mutex_);
  if (const ReadyFrame *frame = next_supplied()) queue.push_new([&] { return *frame; });
}

void Stream::set_faults(const FaultAmounts &amounts, u32 seed) {
  const std::lock_guard lock(mutex_);
  faults_.set(amounts, seed);
  queue.limit_frames(faults_.queue_limit());
  queue.count_unread(!faults_.stalled());
  faulty_ = faults_.any() || !held_.empty();
}

void Stream::clear() {
  const std::lock_guard lock(mutex_);
  queue.clear();
  held_.clear();
  faulty_ = faults_.any();
}

void Stream::end_session() {
  clear();
  queue.end_session();
}

void Stream::take(bool encoding, std::chrono::nanoseconds now) {
  if (encoding && unpaced_ && !faults_.stalled()) {
    const ReadyFrame *frame = held_.empty() ? next_supplied() : nullptr;
    if (frame == nullptr) return;
    queue.passed();
    held_.push_back({*frame, now});
    return;
  }
  const std::size_t most = faults_.stalled() ? 0 : faults_.holds() ? kMaxHeld : 1;
  while (held_.size() < most) {
    auto frame = queue.pop(std::chrono::microseconds{0});
    if (!frame) return;
    held_.push_back({std::move(*frame), now});
  }
}

std::optional<ReadyFrame> Stream::next_faulty(bool encoding, std::chrono::microseconds wait,
                                              std::chrono::nanoseconds now) {
  {
    const std::lock_guard lock(mutex_);
    for (take(encoding, now); !held_.empty() && !faults_.held(held_.front().taken, now);
         take(encoding, now)) {
      const Held first = std::move(held_.front());
      held_.pop_front();
      Passing passing{kind_, first.frame};
      if (!first.repeated) faults_.change(passing);
      if (passing.copies == 0) queue.lost_after_all();
      if (passing.copies > 1) held_.push_front({passing.frame, now, true});
      faulty_ = faults_.any() || !held_.empty();
      if (passing.copies > 0) return std::move(passing.frame);
    }
  }
  std::this_thread::sleep_for(wait);
  return {};
}

}  // namespace virtual_card
