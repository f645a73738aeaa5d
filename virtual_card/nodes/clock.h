/**
 * @file clock.h
 * Card time and the due times of fields.
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
/// The card's clock. Card time is the time since power-up.
class Clock {
 public:
  Clock() { power_up(ClockMode::real_time, 1.0); }

  void power_up(ClockMode mode, double speed);
  ClockMode mode() const;
  nanoseconds now() const;
  /// Returns the monotonic time at a card time; not for the manual clock.
  MonotonicTime when(nanoseconds card_time) const;
  /// Returns how much card time passes in a second of the host.
  nanoseconds second() const;
  /// Manual clock: sets the card time; it never goes back.
  void move_to(nanoseconds card_time);
  /// Returns the wall time at a card time, in microseconds since the epoch.
  microseconds wall(nanoseconds card_time) const;

 private:
  mutable std::mutex mutex_;  // guards all members below
  ClockMode mode_;
  double speed_;
  MonotonicTime start_;
  microseconds wall_start_;
  nanoseconds manual_;
};

/// The due times of fields. Each is computed from the first field of its standard, so rounding errors do not
/// add up.
class FieldSchedule {
 public:
  nanoseconds due(std::int64_t field) const;
  /// Returns the first field that is due at `time` or later.
  std::int64_t first_at(nanoseconds time) const;
  u32 standard() const { return standard_; }
  /// Changes the standard of `field` and all later fields. The due time of `field` does not change.
  void change_standard(u32 standard, std::int64_t field);

 private:
  u32 standard_ = VIDEO_STANDARD_ZV_NTSC;
  std::int64_t anchor_field_ = 0;
  nanoseconds anchor_{0};
};

/// Duration of an audio block: 128 samples at 8 kHz.
inline constexpr nanoseconds kAudioBlock = std::chrono::milliseconds{16};

}  // namespace virtual_card

#endif
