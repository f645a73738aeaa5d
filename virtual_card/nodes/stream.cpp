// The supply of ready-made frames of a stream.
#include "stream.h"

namespace virtual_card {

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

}  // namespace virtual_card
