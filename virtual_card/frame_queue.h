/**
 * @file frame_queue.h
 * A bounded queue of frames between the card's encoders and the host's reads. When it is full, it drops and
 * counts the new frame; it never blocks the card.
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
  /// `capacity` is in bytes of frame data.
  explicit FrameQueue(std::size_t capacity);

  /// Appends a frame. Returns false when the queue is full and the frame is lost.
  bool push(ReadyFrame frame);
  /// Appends the frame that `make` returns. On bad_alloc the frame is lost.
  template <typename Make>
  void push_new(Make make) {
    try {
      push(make());
    } catch (const std::bad_alloc &) {
      missed(1);
    }
  }
  /// Removes and returns the oldest frame. Waits for one at most `wait`; returns none after that time or an
  /// end_session().
  std::optional<ReadyFrame> pop(std::chrono::microseconds wait);
  /// Drops the frames without counting them as lost.
  void clear();
  /// Ends a session of encoding: drops the frames and ends the waits of the pop() calls that are in progress.
  void end_session();
  /// Returns the number of frames that found the queue full since the last call, in sessions in which the
  /// host has read the stream.
  std::uint64_t take_unread();
  /// Tells whether it is the host's fault when the queue is full.
  void count_unread(bool on);
  /// Counts a frame that a read returned without the queue.
  void passed();
  /// Counts a frame that was popped as lost instead of delivered.
  void lost_after_all();
  /// Limits the number of frames as well; none: only `capacity` counts.
  void limit_frames(std::optional<std::int64_t> frames);
  /// Counts as lost the frames that the card did not make, or did not make in time.
  void missed(std::uint64_t frames);
  void reset_counters();
  StreamCounters counters() const;

 private:
  mutable std::mutex mutex_;  ///< guards all members below
  std::condition_variable filled_;
  std::deque<ReadyFrame> frames_;
  std::size_t capacity_;
  std::size_t max_frames_ = ~std::size_t{0};
  std::size_t bytes_ = 0;
  std::uint64_t wakes_ = 0;
  bool counts_unread_ = true;
  bool read_ = false;                 ///< the host has read the stream in this session
  std::uint64_t session_unread_ = 0;  ///< frames of this session that found the queue full
  std::uint64_t unread_ = 0;          ///< those of earlier sessions that count
  StreamCounters counters_;
};

}  // namespace virtual_card

#endif
