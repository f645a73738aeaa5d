// Converts times of the wall clock to local time.
#include "recording/wall_time.h"

namespace recording {

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
  char text[32];
  return {text, std::strftime(text, sizeof text, "%Y-%m-%d %H:%M:%S", &fields)};
}

}  // namespace recording
