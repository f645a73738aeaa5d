// Card time and the due times of fields.
#include "clock.h"

#include <ctime>

namespace virtual_card {
namespace {

/// Returns the wall time at which the manual clock starts, in the local time zone. It is the same in every
/// run, so that pictures do not differ.
microseconds manual_wall_start() {
  std::tm date{};
  date.tm_year = 2009 - 1900;
  date.tm_mon = 2;
  date.tm_mday = 3;
  date.tm_hour = 14;
  date.tm_min = 5;
  date.tm_isdst = -1;
  return std::chrono::seconds{std::mktime(&date)};
}

microseconds wall_now() {
  return std::chrono::duration_cast<microseconds>(std::chrono::system_clock::now().time_since_epoch());
}

}  // namespace

void Clock::power_up(ClockMode mode, double speed) {
  const std::lock_guard lock(mutex_);
  mode_ = mode;
  speed_ = mode == ClockMode::fast ? speed : 1.0;
  start_ = monotonic_now();
  wall_start_ = mode == ClockMode::manual ? manual_wall_start() : wall_now();
  manual_ = nanoseconds{0};
}

ClockMode Clock::mode() const {
  const std::lock_guard lock(mutex_);
  return mode_;
}

nanoseconds Clock::now() const {
  const std::lock_guard lock(mutex_);
  if (mode_ == ClockMode::manual) return manual_;
  const nanoseconds elapsed = monotonic_now() - start_;
  if (mode_ == ClockMode::real_time) return elapsed;
  return nanoseconds{static_cast<std::int64_t>(static_cast<double>(elapsed.count()) * speed_)};
}

MonotonicTime Clock::when(nanoseconds card_time) const {
  const std::lock_guard lock(mutex_);
  if (mode_ != ClockMode::fast) return start_ + card_time;
  return start_ + nanoseconds{static_cast<std::int64_t>(static_cast<double>(card_time.count()) / speed_)};
}

nanoseconds Clock::second() const {
  const std::lock_guard lock(mutex_);
  return nanoseconds{static_cast<std::int64_t>(1e9 * speed_)};
}

void Clock::move_to(nanoseconds card_time) {
  const std::lock_guard lock(mutex_);
  if (card_time > manual_) manual_ = card_time;
}

microseconds Clock::wall(nanoseconds card_time) const {
  const std::lock_guard lock(mutex_);
  return wall_start_ + std::chrono::duration_cast<microseconds>(card_time);
}

nanoseconds FieldSchedule::due(std::int64_t field) const {
  return anchor_ + video_standard(standard_).duration(field - anchor_field_);
}

std::int64_t FieldSchedule::first_at(nanoseconds time) const {
  const VideoStandard &standard = video_standard(standard_);
  std::int64_t field = anchor_field_ + (time - anchor_).count() * standard.period_parts / standard.period_ns;
  while (due(field) < time) ++field;
  return field;
}

void FieldSchedule::change_standard(u32 standard, std::int64_t field) {
  anchor_ = due(field);
  anchor_field_ = field;
  standard_ = standard;
}

}  // namespace virtual_card
