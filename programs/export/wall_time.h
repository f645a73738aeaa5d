/**
 * @file wall_time.h
 * Times of the wall clock: reading and printing them, and stretches of them.
 */
#ifndef EXPORT_WALL_TIME_H
#define EXPORT_WALL_TIME_H

#include <cstdint>
#include <ctime>
#include <limits>
#include <optional>
#include <string>
#include <vector>

#include "recording/wall_time.h"

namespace clips {

using Milliseconds = std::int64_t;  ///< since 1970, or a length

using recording::hour_begin, recording::kHour, recording::local_text;

/// A time in an index is when a frame or block reached the recorder. It may be late by this much without a
/// gap.
inline constexpr Milliseconds kJitter = 200;
/// A step back of the clock; less is jitter.
inline constexpr Milliseconds kSetBack = 2000;

/// From `from`, included, to `to`, excluded.
struct Stretch {
  Milliseconds from = std::numeric_limits<Milliseconds>::min();
  Milliseconds to = std::numeric_limits<Milliseconds>::max();
  bool overlaps(const Stretch &other) const { return from < other.to && other.from < to; }
};

/// Adds a stretch, to the last one if they touch.
void append(std::vector<Stretch> &stretches, const Stretch &stretch);

/// Which one of two equal local times: when the clock goes back in autumn, an hour comes twice.
enum class Pass { first, second };
/// Returns the time of local date and time.
Milliseconds from_local(std::tm fields, Pass pass);

/// Reads "2026-11-25 14:58" or "2026-11-25 14:58:30", local time, or with a difference to UTC behind it:
/// "2026-10-25 02:30 +0100". With `after`, the day may be left out: it is then the first such time behind
/// `after`. Throws UsageError.
Milliseconds parse_time(const std::string &option, const std::string &text, Pass pass,
                        std::optional<Milliseconds> after = std::nullopt);

std::string utc_text(Milliseconds time);       ///< "2026-11-25T13:58:00.120000Z"
std::string length_text(Milliseconds length);  ///< "1:02:03"

}  // namespace clips

#endif
