// The buffer between the SDK's threads and the writer.
#include "ring.h"

#include <algorithm>
#include <cstring>

namespace recorder {
namespace {

/// Length of a record without a frame: the next frame begins at the start of the memory.
constexpr std::uint32_t kSkip = ~std::uint32_t{0};

std::size_t record_size(std::uint32_t length) {
  return (sizeof(Frame) + length + alignof(Frame) - 1) / alignof(Frame) * alignof(Frame);
}

}  // namespace

// A frame is in one piece, so that it can be written with one iovec. If it does not fit in front of the end
// of the memory, that rest stays unused.
bool Ring::push(const Frame &frame, const u8 *data) {
  const std::uint64_t head = head_.load(std::memory_order_relaxed);
  const std::size_t size = record_size(frame.length);
  const std::size_t skipped = size > rest(head) ? rest(head) : 0;
  if (head + skipped + size - tail_.load(std::memory_order_acquire) > memory_.size()) return false;
  if (skipped >= sizeof(Frame)) {
    Frame skip{};
    skip.length = kSkip;
    std::memcpy(&memory_[head % memory_.size()], &skip, sizeof skip);
  }
  std::byte *const record = &memory_[(head + skipped) % memory_.size()];
  std::memcpy(record, &frame, sizeof frame);
  std::copy_n(reinterpret_cast<const std::byte *>(data), frame.length,
              record + sizeof frame);  // it may be empty
  head_.store(head + skipped + size, std::memory_order_release);
  return true;
}

Ring::Taken Ring::take() {
  const std::uint64_t head = head_.load(std::memory_order_acquire);
  if (taken_ == head) return {nullptr, taken_};
  const auto at = [this] { return reinterpret_cast<const Frame *>(&memory_[taken_ % memory_.size()]); };
  // The producer moves its position past the rest and the frame behind it in one step.
  if (rest(taken_) < sizeof(Frame) || at()->length == kSkip) taken_ += rest(taken_);
  const Taken taken{at(), taken_};
  taken_ += record_size(taken.frame->length);
  return taken;
}

}  // namespace recorder
