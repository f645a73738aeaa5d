// The names of folders and files of recordings, and the creation of the folders.
#include "recording/tree.h"

#include <sys/stat.h>

#include <cerrno>
#include <charconv>
#include <cstdio>
#include <string_view>

#include "recording/wall_time.h"
#include "zv_type.h"

namespace recording {
namespace {

struct KindRow {
  const char *folder;
  const char *extension;
  unsigned channels;
};
constexpr KindRow kKinds[] = {{"/Video", ".rec", ZV_CHANNELS}, {"/Audio", ".aud", ZV_AUDIO_CHANNELS}};

const KindRow &row_of(Kind kind) {
  return kKinds[static_cast<std::size_t>(kind)];
}

std::string day_name(const std::tm &time) {
  char text[48];
  std::snprintf(text, sizeof text, "%d%02d%02d", time.tm_year + 1900, time.tm_mon + 1, time.tm_mday);
  return text;
}

/// Reads a text of decimal digits alone.
std::optional<unsigned> number_in(std::string_view digits) {
  unsigned number = 0;
  const char *const last = digits.data() + digits.size();
  const auto [end, error] = std::from_chars(digits.data(), last, number);
  return error == std::errc{} && end == last ? std::optional(number) : std::nullopt;
}

/// Returns 0 if the folder exists now, else an errno.
int make_folder(const std::string &path) {
  return mkdir(path.c_str(), 0777) == 0 || errno == EEXIST ? 0 : errno;
}

}  // namespace

std::tm local_time() {
  tzset();
  return local_fields(std::int64_t{std::time(nullptr)} * 1000);
}

std::string kind_folder(const std::string &root, Kind kind) {
  return root + row_of(kind).folder;
}

std::string day_folder(const std::string &root, Kind kind, const std::tm &time) {
  return kind_folder(root, kind) + "/" + day_name(time);
}

std::string channel_folder(const std::string &day_folder, unsigned channel) {
  char name[16];
  std::snprintf(name, sizeof name, "/CH%02u", channel + 1);
  return day_folder + name;
}

std::string hour_name(const std::tm &time) {
  char hour[16];
  std::snprintf(hour, sizeof hour, "-%02d", time.tm_hour);
  return day_name(time) + hour;
}

std::string file_name(Kind kind, const std::tm &time, unsigned part) {
  const std::string number = part == 0 ? "" : "." + std::to_string(part);
  return hour_name(time) + number + row_of(kind).extension;
}

std::optional<NamedHour> parse_file_name(const std::string &name) {
  constexpr std::size_t kDayLength = 8, kHourLength = 11;  // "20090303", "20090303-14"
  const std::string_view text = name;
  if (text.size() < kHourLength || text[kDayLength] != '-') return std::nullopt;
  const auto day = number_in(text.substr(0, kDayLength)), hour = number_in(text.substr(kDayLength + 1, 2));
  if (!day || !hour || *hour > 23) return std::nullopt;
  NamedHour named;
  named.hour.tm_year = static_cast<int>(*day / 10000) - 1900;
  named.hour.tm_mon = static_cast<int>(*day / 100 % 100) - 1;
  named.hour.tm_mday = static_cast<int>(*day % 100);
  named.hour.tm_hour = static_cast<int>(*hour);
  const std::string_view rest = text.substr(kHourLength);
  if (rest.empty()) return named;
  const std::size_t dot = rest.rfind('.');
  if (dot == std::string_view::npos) return std::nullopt;
  named.extension = rest.substr(dot);
  if (dot == 0) return named;
  const auto part = rest.front() == '.' ? number_in(rest.substr(1, dot - 1)) : std::nullopt;
  if (!part) return std::nullopt;
  named.part = *part;
  return named;
}

std::optional<unsigned> parse_channel_folder(const std::string &name) {
  const auto number = name.size() == 4 && name.starts_with("CH") ? number_in(name.substr(2)) : std::nullopt;
  return number && *number > 0 ? std::optional(*number - 1) : std::nullopt;
}

std::string extension_of(Kind kind) {
  return row_of(kind).extension;
}

int make_day_folder(const std::string &root, Kind kind, const std::tm &time) {
  int first_error = make_folder(kind_folder(root, kind));
  const auto make = [&first_error](const std::string &path) {
    const int error = make_folder(path);
    if (first_error == 0) first_error = error;
  };
  const std::string day = day_folder(root, kind, time);
  make(day);
  for (unsigned channel = 0; channel < row_of(kind).channels; ++channel) make(channel_folder(day, channel));
  return first_error;
}

}  // namespace recording
