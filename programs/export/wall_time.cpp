// Reads and prints times of the wall clock.
#include "wall_time.h"

#include <cstdio>

#include "programs/common/command_line.h"

namespace clips {
namespace {

std::tm local_fields(Milliseconds time) {
  const std::time_t seconds = time / 1000;
  std::tm fields{};
  localtime_r(&seconds, &fields);
  return fields;
}

std::string formatted(const char *format, const std::tm &fields) {
  char text[64];
  return {text, std::strftime(text, sizeof text, format, &fields)};
}

/// Reads the whole text by a format of strptime().
bool matches(const std::string &text, const char *format, std::tm &fields) {
  const char *const end = strptime(text.c_str(), format, &fields);
  return end != nullptr && *end == '\0';
}

}  // namespace

Milliseconds from_local(std::tm fields) {
  fields.tm_isdst = -1;
  return Milliseconds{std::mktime(&fields)} * 1000;
}

Milliseconds hour_of(Milliseconds time) {
  const std::tm fields = local_fields(time);
  return (time / 1000 - fields.tm_min * 60 - fields.tm_sec) * 1000;
}

Milliseconds parse_time(const std::string &option, const std::string &text,
                        std::optional<Milliseconds> after) {
  for (const char *format : {"%Y-%m-%d %H:%M", "%Y-%m-%d %H:%M:%S", "%Y-%m-%dT%H:%M", "%Y-%m-%dT%H:%M:%S"}) {
    std::tm fields{};
    if (matches(text, format, fields)) return from_local(fields);
  }
  for (const char *format : {"%H:%M", "%H:%M:%S"}) {
    std::tm fields = local_fields(after.value_or(0));
    fields.tm_sec = 0;
    if (!after || !matches(text, format, fields)) continue;
    const Milliseconds time = from_local(fields);
    ++fields.tm_mday;
    return time > *after ? time : from_local(fields);
  }
  throw UsageError(option + ": '" + text + "' is not a time such as \"2026-11-25 14:58\"");
}

std::string local_text(Milliseconds time) {
  return formatted("%Y-%m-%d %H:%M:%S", local_fields(time));
}

std::string utc_text(Milliseconds time) {
  const std::time_t seconds = time / 1000;
  std::tm fields{};
  gmtime_r(&seconds, &fields);
  char fraction[16];
  std::snprintf(fraction, sizeof fraction, ".%03d000Z", static_cast<int>(time % 1000));
  return formatted("%Y-%m-%dT%H:%M:%S", fields) + fraction;
}

std::string length_text(Milliseconds length) {
  char text[48];
  std::snprintf(text, sizeof text, "%lld:%02lld:%02lld", static_cast<long long>(length / kHour),
                static_cast<long long>(length / 60000 % 60), static_cast<long long>(length / 1000 % 60));
  return text;
}

}  // namespace clips
