/**
 * @file clock.h
 * Card time, and when fields are due in it.
 */
#ifndef VIRTUAL_CARD_CLOCK_H
#define VIRTUAL_CARD_CLOCK_H

#include <chrono>
#include <mutex>

#include "card_state.h"
#include "host/monotonic_time.h"

namespace virtual_card {

using std::chrono::microseconds;
using std::chrono::nanoseconds;
/// Time since power-up.
class Clock {
 public:
  Clock() { power_up(ClockMode::real_time, 1.0); }

  void power_up(ClockMode mode, double speed);
  ClockMode mode() const;
  nanoseconds now() const;
  /// When the host's monotonic clock will show this card time; not with the manual clock.
  MonotonicTime when(nanoseconds card_time) const;
  /// How much card time passes in a second of the host's.
  nanoseconds second() const;
  /// Manual clock: moves on, never back.
  void move_to(nanoseconds card_time);
  /// The wall clock, in microseconds since the epoch, at a card time.
  microseconds wall(nanoseconds card_time) const;

 private:
  mutable std::mutex mutex_;  // guards everything below
  ClockMode mode_;
  double speed_;
  MonotonicTime start_;
  microseconds wall_start_;
  nanoseconds manual_;
};

/// The due times of fields. Each is computed from the first field of its standard, so that no error adds up.
class FieldSchedule {
 public:
  nanoseconds due(std::int64_t field) const;
  /// The first field that is due at this time or later.
  std::int64_t first_at(nanoseconds time) const;
  u32 standard() const { return standard_; }
  /// Fields from `field` on follow another standard; `field` itself keeps its due time.
  void change_standard(u32 standard, std::int64_t field);

 private:
  u32 standard_ = VIDEO_STANDARD_ZV_NTSC;
  std::int64_t anchor_field_ = 0;
  nanoseconds anchor_{0};
};

/// Start of an audio block, 128 samples at 8 kHz each.
inline constexpr nanoseconds kAudioBlock = std::chrono::milliseconds{16};

}  // namespace virtual_card

#endif
