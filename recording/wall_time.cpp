// Converts times of the wall clock to local time.
#include "recording/wall_time.h"

namespace recording {
namespace {

/// Whether the clock shows a time a second time, since it goes back by an hour.
bool comes_twice(std::int64_t time) {
  const int hour = local_fields(time).tm_hour;
  return local_fields(time - kHour).tm_hour == hour || local_fields(time + kHour).tm_hour == hour;
}

}  // namespace

std::tm local_fields(std::int64_t time) {
  const std::time_t seconds = time / 1000;
  std::tm fields{};
  localtime_r(&seconds, &fields);
  return fields;
}

std::int64_t hour_begin(std::int64_t time) {
  const std::tm fields = local_fields(time);
  return (time / 1000 - fields.tm_min * 60 - fields.tm_sec) * 1000;
}

std::string local_text(std::int64_t time) {
  const std::tm fields = local_fields(time);
  const char *const format = comes_twice(time) ? "%Y-%m-%d %H:%M:%S %z" : "%Y-%m-%d %H:%M:%S";
  char text[32];
  return {text, std::strftime(text, sizeof text, format, &fields)};
}

}  // namespace recording
