// Reads and prints times of the wall clock.
#include "wall_time.h"

#include <algorithm>
#include <cstdio>

#include "programs/common/command_line.h"

namespace clips {
namespace {

/// Reads the whole text by a format of strptime().
bool matches(const std::string &text, const char *format, std::tm &fields) {
  const char *const end = strptime(text.c_str(), format, &fields);
  return end != nullptr && *end == '\0';
}

}  // namespace

void append(std::vector<Stretch> &stretches, const Stretch &stretch) {
  if (!stretches.empty() && stretches.back().to >= stretch.from)
    stretches.back().to = std::max(stretches.back().to, stretch.to);
  else
    stretches.push_back(stretch);
}

Milliseconds from_local(std::tm fields) {
  fields.tm_isdst = -1;
  return Milliseconds{std::mktime(&fields)} * 1000;
}

Milliseconds parse_time(const std::string &option, const std::string &text,
                        std::optional<Milliseconds> after) {
  for (const char *format : {"%Y-%m-%d %H:%M", "%Y-%m-%d %H:%M:%S", "%Y-%m-%dT%H:%M", "%Y-%m-%dT%H:%M:%S"}) {
    std::tm fields{};
    if (matches(text, format, fields)) return from_local(fields);
  }
  for (const char *format : {"%H:%M", "%H:%M:%S"}) {
    std::tm fields = recording::local_fields(after.value_or(0));
    fields.tm_sec = 0;
    if (!after || !matches(text, format, fields)) continue;
    const Milliseconds time = from_local(fields);
    ++fields.tm_mday;
    return time > *after ? time : from_local(fields);
  }
  throw UsageError(option + ": '" + text + "' is not a time such as \"2026-11-25 14:58\"");
}

std::string utc_text(Milliseconds time) {
  const std::time_t seconds = time / 1000;
  std::tm fields{};
  gmtime_r(&seconds, &fields);
  char text[32], fraction[16];
  std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%S", &fields);
  std::snprintf(fraction, sizeof fraction, ".%03d000Z", static_cast<int>(time % 1000));
  return std::string(text) + fraction;
}

std::string length_text(Milliseconds length) {
  char text[48];
  std::snprintf(text, sizeof text, "%lld:%02lld:%02lld", static_cast<long long>(length / kHour),
                static_cast<long long>(length / 60000 % 60), static_cast<long long>(length / 1000 % 60));
  return text;
}

}  // namespace clips
