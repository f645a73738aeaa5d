// The names of folders and files of recordings, and the creation of the folders.
#include "recording/tree.h"

#include <sys/stat.h>

#include <cstdio>

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

void make_folder(const std::string &path) {
  mkdir(path.c_str(), 0777);
}

}  // namespace

std::tm local_time() {
  const std::time_t now = std::time(nullptr);
  std::tm fields{};
  tzset();
  localtime_r(&now, &fields);
  return fields;
}

std::string day_folder(const std::string &root, Kind kind, const std::tm &time) {
  return root + row_of(kind).folder + "/" + day_name(time);
}

std::string channel_folder(const std::string &day_folder, unsigned channel) {
  char name[16];
  std::snprintf(name, sizeof name, "/CH%02u", channel + 1);
  return day_folder + name;
}

std::string file_name(Kind kind, const std::tm &time, unsigned part) {
  char hour[16];
  std::snprintf(hour, sizeof hour, "-%02d", time.tm_hour);
  const std::string number = part == 0 ? "" : "." + std::to_string(part);
  return day_name(time) + hour + number + row_of(kind).extension;
}

void make_day_folder(const std::string &root, Kind kind, const std::tm &time) {
  make_folder(root + row_of(kind).folder);
  const std::string day = day_folder(root, kind, time);
  make_folder(day);
  for (unsigned channel = 0; channel < row_of(kind).channels; ++channel)
    make_folder(channel_folder(day, channel));
}

}  // namespace recording
