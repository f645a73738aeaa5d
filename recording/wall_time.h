/**
 * @file wall_time.h
 * Times of the wall clock, in milliseconds since 1970, and what they are in local time.
 */
#ifndef RECORDING_WALL_TIME_H
#define RECORDING_WALL_TIME_H

#include <cstdint>
#include <ctime>
#include <string>

namespace recording {

/// The length of an hour in milliseconds.
inline constexpr std::int64_t kHour = 3600000;

std::tm local_fields(std::int64_t time);
/// Returns the start of the local clock hour.
std::int64_t hour_begin(std::int64_t time);
/// Returns, for example, "2026-11-25 14:58:00". In an hour that comes twice the difference to UTC follows:
/// "2026-10-25 02:30:00 +0100".
std::string local_text(std::int64_t time);

}  // namespace recording

#endif
