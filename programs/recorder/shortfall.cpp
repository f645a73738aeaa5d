// Tells loss of frames from clocks that run at different speeds.
#include "shortfall.h"

#include <algorithm>
#include <cstdio>

namespace recorder {
namespace {

using Counts = Shortfall::Counts;

constexpr std::uint64_t kOnTheirWay = 2;  ///< the first and the last frame of a time
constexpr std::uint64_t kMinuteShare = 100, kHourShare = 2000;

std::uint64_t short_of(Counts from, Counts to) {
  const std::uint64_t expected = to.expected - from.expected;
  return expected - std::min(expected, to.frames - from.frames);
}

/// Whether so many of the frames that were due are more than one in `share`.
bool is_loss(std::uint64_t missing, std::uint64_t expected, std::uint64_t share) {
  return missing > kOnTheirWay && missing * share > expected;
}

std::string text_of(std::uint64_t missing, std::uint64_t expected, const char *time) {
  char text[96];
  std::snprintf(text, sizeof text, "%ju of %ju were missing in the last %s", std::uintmax_t{missing},
                std::uintmax_t{expected}, time);
  return text;
}

}  // namespace

/// Frames that a minute missed can come in the next.
std::uint64_t Shortfall::missing_in_hour(Counts now) const {
  const std::uint64_t missing = short_of(hour_, now);
  const bool all = missing > told_ && is_loss(missing - told_, now.expected - hour_.expected, kHourShare);
  return all ? missing : std::min(missing, told_);
}

std::uint64_t Shortfall::missing(Counts now) const {
  return hours_ + missing_in_hour(now);
}

std::string Shortfall::end_minute(Counts now) {
  std::string text;
  const std::uint64_t in_minute = short_of(minute_, now), expected = now.expected - minute_.expected;
  if (is_loss(in_minute, expected, kMinuteShare)) {
    told_ += in_minute;
    text = text_of(in_minute, expected, "minute");
  }
  minute_ = now;
  if (++minutes_ < 60) return text;
  const std::uint64_t in_hour = missing_in_hour(now);
  if (in_hour > told_) text = text_of(in_hour, now.expected - hour_.expected, "hour");
  hours_ += in_hour;
  hour_ = now;
  minutes_ = 0;
  told_ = 0;
  return text;
}

}  // namespace recorder
