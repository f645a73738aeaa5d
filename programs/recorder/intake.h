/**
 * @file intake.h
 * What the SDK's threads do with a frame: they watch the streams, and copy the frame into the buffer.
 */
#ifndef RECORDER_INTAKE_H
#define RECORDER_INTAKE_H

#include <array>
#include <atomic>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <memory>

#include "frame.h"
#include "options.h"
#include "ring.h"

namespace recorder {

using Clock = std::chrono::steady_clock;

/// What has come of a stream. Written by one thread of the SDK, read by any thread.
struct Arrivals {
  std::atomic<std::uint64_t> frames{0}, bytes{0};
  std::atomic<std::uint64_t> lost{0};  ///< frames that found the buffer full
  std::atomic<std::uint64_t> gaps{0}, longest_gap_ms{0};
  std::atomic<std::uint64_t> motion{0}, no_signal{0};
  std::atomic<Clock::rep> first{0}, last{0};  ///< monotonic times of frames; 0 before the first
};

class Intake {
 public:
  /// Allocates the buffer, the only allocation of the way of a frame, and touches all of its memory.
  explicit Intake(const Options &options);

  /// Takes a frame on a thread of the SDK. Does not allocate and takes no lock. If the buffer is full, the
  /// frame is lost, and with it all frames up to the next intra frame.
  void take(unsigned stream, const u8 *data, i32 length, i32 flags);

  bool records(unsigned stream) const { return chosen_ >> stream & 1u; }
  /// Returns frames or audio blocks a second.
  double rate(unsigned stream) const { return is_video(stream) ? video_rate_ : audio_rate_; }
  const Arrivals &arrivals(unsigned stream) const { return arrivals_[stream]; }
  /// Returns how many frames are due at a time, counted from the first.
  std::uint64_t expected(unsigned stream, Clock::time_point now) const;

  /// Two buffers, because two threads fill them: each buffer then has one producer.
  Ring &video() { return video_; }
  Ring &audio() { return audio_; }
  const Ring &video() const { return video_; }

  /// A silence as long as this is a gap.
  Clock::duration gap_limit(unsigned stream) const;
  /// Returns how long a stream has been silent, in milliseconds; 0 if that is no gap, and before its first
  /// frame.
  std::uint32_t silence_ms(unsigned stream, Clock::time_point now) const;
  /// Returns how many frames found the buffer full since the last frame that is in it. Call it when no
  /// callback runs any more.
  std::uint32_t last_loss(unsigned stream) const { return losses_[stream].frames; }

 private:
  /// What the next frame of a stream tells of those before it. Belongs to the thread of the SDK.
  struct Loss {
    bool skipping = false;  ///< a frame is lost, and no intra frame has come since
    std::uint32_t frames = 0;
    std::uint32_t gap_ms = 0;
  };
  /// Returns the length of the gap that a frame ends, or 0.
  std::uint32_t note_arrival(const Frame &frame);

  u32 chosen_;  ///< mask of streams
  bool mpeg4_;
  double video_rate_, audio_rate_;
  std::unique_ptr<std::byte[]> memory_;
  Ring video_, audio_;
  std::array<Arrivals, kStreams> arrivals_;
  std::array<Loss, kStreams> losses_;
};

}  // namespace recorder

#endif
