#ifndef VIRTUAL_CARD_STREAM_H
#define VIRTUAL_CARD_STREAM_H

#include <atomic>

#include "frame_queue.h"

namespace virtual_card {

/// One of the card's three streams: the queue behind it, and the supply of ready-made frames that can
/// take the encoders' place.
class Stream {
 public:
  explicit Stream(std::size_t capacity) : queue(capacity) {}

  /// `rate` frames a second of card time; 0: as fast as they are read.
  void supply(std::vector<ReadyFrame> frames, double rate, std::uint64_t limit);
  void clear_supply();
  /// Frames a second of a paced supply, 0 without one.
  double pace() const;
  /// A paced supply's next frame has come due.
  void supply_due();

  /// Hands the next frame over; its read result, or 0 when none came in the time. A supply
  /// answers only while `encoding`.
  template <typename Place>
  long read(bool encoding, std::chrono::microseconds wait, Place place);

  FrameQueue queue;

 private:
  const ReadyFrame *next_supplied();

  std::atomic<bool> unpaced_{false};  // an unpaced supply answers reads: keeps its lock off other reads
  mutable std::mutex mutex_;          // guards everything below
  std::vector<ReadyFrame> frames_;
  double rate_ = 0;
  std::size_t next_ = 0;
  std::uint64_t left_ = 0;
};

template <typename Place>
long Stream::read(bool encoding, std::chrono::microseconds wait, Place place) {
  if (encoding && unpaced_.load(std::memory_order_relaxed)) {
    const std::lock_guard lock(mutex_);
    if (const ReadyFrame *frame = next_supplied()) {
      place(frame->area);
      queue.passed();
      return frame->result;
    }
  }
  const auto frame = queue.pop(wait);
  if (!frame) return 0;
  place(frame->area);
  return frame->result;
}

}  // namespace virtual_card

#endif
