/**
 * @file ring.h
 * A bounded buffer of frames between one thread that produces and one that consumes. It needs no lock.
 */
#ifndef RECORDER_RING_H
#define RECORDER_RING_H

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <span>

#include "frame.h"

namespace recorder {

/// Positions count bytes from the beginning and only grow.
class Ring {
 public:
  /// Uses memory of the caller, aligned to alignof(Frame). Its size must be a multiple of that.
  explicit Ring(std::span<std::byte> memory) : memory_(memory) {}

  /// Producer: copies a frame into the buffer. Returns false if there is no space.
  bool push(const Frame &frame, const u8 *data);

  struct Taken {
    const Frame *frame;
    std::uint64_t position;
  };
  /// Consumer: returns the next frame, or a null frame if there is none. It stays valid until release().
  Taken take();
  /// Consumer: gives the space of all taken frames in front of a position back.
  void release(std::uint64_t position) { tail_.store(position, std::memory_order_release); }
  /// Consumer: the position behind the last frame that was taken.
  std::uint64_t taken() const { return taken_; }

  /// Any thread.
  std::size_t used() const {
    const std::uint64_t tail = tail_.load();  // before the head, which only moves away from it
    return head_.load() - tail;
  }
  std::size_t capacity() const { return memory_.size(); }

 private:
  /// Returns how many bytes lie between a position and the end of the memory.
  std::size_t rest(std::uint64_t position) const { return memory_.size() - position % memory_.size(); }

  std::span<std::byte> memory_;
  alignas(64) std::atomic<std::uint64_t> head_{0};  ///< behind the newest frame; written by the producer
  alignas(64) std::atomic<std::uint64_t> tail_{0};  ///< the oldest frame; written by the consumer
  std::uint64_t taken_ = 0;                         ///< of the consumer
};

}  // namespace recorder

#endif
