/**
 * @file stream.h
 * A stream of the card: its queue and its supply of ready-made frames.
 */
#ifndef VIRTUAL_CARD_STREAM_H
#define VIRTUAL_CARD_STREAM_H

#include <atomic>

#include "frame_queue.h"

namespace virtual_card {

/// One of the card's three streams: its queue, and the supply of ready-made frames that can replace the
/// encoders.
class Stream {
 public:
  explicit Stream(std::size_t capacity) : queue(capacity) {}

  /// Sets the supply: `rate` frames a second of card time; 0: one frame for each read.
  void supply(std::vector<ReadyFrame> frames, double rate, std::uint64_t limit);
  void clear_supply();
  /// Returns frames a second of a supply with a rate, or 0 without such a supply.
  double pace() const;
  /// Queues the next frame of the supply.
  void supply_due();

  /// Calls `place` with the data of the next frame and returns the frame's read result, or returns 0 when
  /// none came within `wait`. A supply without a rate delivers only while `encoding`.
  template <typename Place>
  long read(bool encoding, std::chrono::microseconds wait, Place place);

  FrameQueue queue;

 private:
  const ReadyFrame *next_supplied();

  std::atomic<bool> unpaced_{false};  // there is a supply without a rate; read without the lock
  mutable std::mutex mutex_;          // guards all members below
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
