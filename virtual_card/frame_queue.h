/**
 * @file frame_queue.h
 * A bounded queue of frames between the card's encoders and the host's reads. A full queue loses the
 * new frame and counts it; it never blocks the card.
 */
#ifndef VIRTUAL_CARD_FRAME_QUEUE_H
#define VIRTUAL_CARD_FRAME_QUEUE_H

#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <deque>
#include <mutex>
#include <new>
#include <optional>
#include <vector>

#include "virtual_card.h"

namespace virtual_card {

class FrameQueue {
 public:
  /// `capacity` in bytes of frame data.
  explicit FrameQueue(std::size_t capacity);

  /// False when the frame was lost.
  bool push(ReadyFrame frame);
  /// Pushes the frame that `make` returns. One for which memory is short is lost.
  template <typename Make>
  void push_new(Make make) {
    try {
      push(make());
    } catch (const std::bad_alloc &) {
      missed(1);
    }
  }
  /// The oldest frame, waiting for one at most `wait`; none after the wait or a wake().
  std::optional<ReadyFrame> pop(std::chrono::microseconds wait);
  /// Ends the waits of pop() now in progress.
  void wake();
  /// Forgets the frames, not the counters.
  void clear();
  /// Counts a frame that went to the host past the queue.
  void passed();
  /// Counts frames that the card came too late to make.
  void missed(std::uint64_t frames);
  void reset_counters();
  StreamCounters counters() const;

 private:
  mutable std::mutex mutex_;  ///< guards everything below
  std::condition_variable filled_;
  std::deque<ReadyFrame> frames_;
  std::size_t capacity_;
  std::size_t bytes_ = 0;
  std::uint64_t wakes_ = 0;
  StreamCounters counters_;
};

}  // namespace virtual_card

#endif
