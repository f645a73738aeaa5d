// Reads and prints times of the wall clock.
#include "wall_time.h"

#include <algorithm>
#include <cstdio>

#include "programs/common/command_line.h"

namespace clips {
namespace {

std::tm utc_fields(Milliseconds time) {
  const std::time_t seconds = time / 1000;
  std::tm fields{};
  gmtime_r(&seconds, &fields);
  return fields;
}

/// A time as the user writes it.
struct Written {
  std::tm fields{};
  bool utc_known = false;  ///< tm_gmtoff is the difference to UTC

  /// Reads the whole text by a format of strptime().
  bool read(const std::string &text, const char *format) {
    fields = {};
    const char *end = strptime(text.c_str(), format, &fields);
    utc_known = end != nullptr && *end != '\0';
    if (utc_known) end = strptime(end, " %z", &fields);
    return end != nullptr && *end == '\0';
  }
  /// Takes the day on which a time is.
  void set_day(Milliseconds time) {
    const std::tm day =
        utc_known ? utc_fields(time + Milliseconds{fields.tm_gmtoff} * 1000) : recording::local_fields(time);
    fields.tm_year = day.tm_year;
    fields.tm_mon = day.tm_mon;
    fields.tm_mday = day.tm_mday;
  }
  Milliseconds time(Pass pass) const {
    if (!utc_known) return from_local(fields, pass);
    std::tm utc = fields;
    return (Milliseconds{timegm(&utc)} - fields.tm_gmtoff) * 1000;
  }
};

}  // namespace

void append(std::vector<Stretch> &stretches, const Stretch &stretch) {
  if (!stretches.empty() && stretches.back().to >= stretch.from)
    stretches.back().to = std::max(stretches.back().to, stretch.to);
  else
    stretches.push_back(stretch);
}

Milliseconds from_local(std::tm fields, Pass pass) {
  fields.tm_isdst = -1;
  const Milliseconds time = Milliseconds{std::mktime(&fields)} * 1000;
  const Milliseconds other = time + (pass == Pass::first ? -kHour : kHour);
  return recording::local_fields(other).tm_hour == fields.tm_hour ? other : time;
}

Milliseconds parse_time(const std::string &option, const std::string &text, Pass pass,
                        std::optional<Milliseconds> after) {
  Written written;
  for (const char *format : {"%Y-%m-%d %H:%M", "%Y-%m-%d %H:%M:%S", "%Y-%m-%dT%H:%M", "%Y-%m-%dT%H:%M:%S"})
    if (written.read(text, format)) return written.time(pass);
  for (const char *format : {"%H:%M", "%H:%M:%S"}) {
    if (!after || !written.read(text, format)) continue;
    written.set_day(*after);
    const Milliseconds time = written.time(pass);
    ++written.fields.tm_mday;
    return time > *after ? time : written.time(pass);
  }
  throw UsageError(option + ": '" + text + "' is not a time such as \"2026-11-25 14:58\"");
}

std::string utc_text(Milliseconds time) {
  const std::tm fields = utc_fields(time);
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
