/**
 * @file stream.h
 * A stream of the card: its queue and its supply of ready-made frames.
 */
#ifndef VIRTUAL_CARD_STREAM_H
#define VIRTUAL_CARD_STREAM_H

#include <atomic>
#include <deque>
#include <mutex>
#include <optional>

#include "frame_queue.h"
#include "stream_faults.h"

namespace virtual_card {

/// One of the card's three streams: its queue, the supply of ready-made frames that can replace the encoders,
/// and its faults.
class Stream {
 public:
  Stream(StreamKind kind, std::size_t capacity) : queue(capacity), kind_(kind), faults_(kind) {}

  void set_faults(const FaultAmounts &amounts, u32 seed);
  /// Drops the frames without counting them as lost.
  void clear();
  /// Does the same, and ends the waits of reads.
  void end_session();

  /// Sets the supply: `rate` frames a second of card time; 0: one frame for each read.
  void supply(std::vector<ReadyFrame> frames, double rate, std::uint64_t limit);
  void clear_supply();
  /// Returns frames a second of a supply with a rate, or 0 without such a supply.
  double pace() const;
  /// Queues the next frame of the supply.
  void supply_due();

  /// Calls `place` with the data of the next frame and returns the frame's read result, or returns 0 when
  /// none came within `wait`. A supply without a rate delivers only while `encoding`. Faults hold frames back
  /// by the card time that `now` returns.
  template <typename Now, typename Place>
  long read(bool encoding, std::chrono::microseconds wait, Now now, Place place);

  FrameQueue queue;

 private:
  struct Held {
    ReadyFrame frame;
    std::chrono::nanoseconds taken;
    bool repeated = false;  ///< the second copy of a frame, which no fault changes again
  };
  const ReadyFrame *next_supplied();
  /// Returns the next frame as the faults let it through, or none.
  std::optional<ReadyFrame> next_faulty(bool encoding, std::chrono::microseconds wait,
                                        std::chrono::nanoseconds now);
  /// Takes the frames that wait in the queue, or the next one of a supply without a rate.
  void take(bool encoding, std::chrono::nanoseconds now);

  const StreamKind kind_;
  std::atomic<bool> faulty_{false};   // there is a fault or a held frame; read without the lock
  std::atomic<bool> unpaced_{false};  // there is a supply without a rate; read without the lock
  mutable std::mutex mutex_;          // guards all members below
  std::vector<ReadyFrame> frames_;
  double rate_ = 0;
  std::size_t next_ = 0;
  std::uint64_t left_ = 0;
  StreamFaults faults_;
  std::deque<Held> held_;  // frames that a fault holds back, and second copies
};

template <typename Now, typename Place>
long Stream::read(bool encoding, std::chrono::microseconds wait, Now now, Place place) {
  if (faulty_.load(std::memory_order_relaxed)) {
    const auto frame = next_faulty(encoding, wait, now());
    if (!frame) return 0;
    place(frame->area);
    return frame->result;
  }
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
