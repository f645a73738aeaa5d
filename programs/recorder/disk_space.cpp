// Looks after the space on the disk.
#include "disk_space.h"

#include <sys/statvfs.h>
#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <filesystem>
#include <map>
#include <vector>

#include "recording/tree.h"

namespace fs = std::filesystem;

namespace recorder {
namespace {

/// Returns a name with 0 for each digit.
std::string shape_of(std::string name) {
  std::replace_if(
      name.begin(), name.end(), [](unsigned char c) { return std::isdigit(c) != 0; }, '0');
  return name;
}

/// Returns the hour in the name of a recording or an index, as "20261125-14", or an empty text for another
/// name.
std::string hour_in(const std::string &name) {
  constexpr const char *kExtensions[] = {".rec", ".idx", ".aud"};
  const auto named = recording::parse_file_name(name);
  const bool known = named && std::find(std::begin(kExtensions), std::end(kExtensions), named->extension) !=
                                  std::end(kExtensions);
  return known ? name.substr(0, name.find('.')) : "";
}

/// Returns the entries of a folder; none if it cannot be read.
std::vector<fs::path> entries_of(const fs::path &folder) {
  std::vector<fs::path> entries;
  std::error_code error;
  for (fs::directory_iterator at(folder, error), end; !error && at != end; at.increment(error))
    entries.push_back(at->path());
  return entries;
}

/// Returns the folders in a folder whose names have a shape. Leaves out links.
std::vector<fs::path> folders_of(const fs::path &folder, const std::string &shape) {
  std::vector<fs::path> folders = entries_of(folder);
  std::erase_if(folders, [&shape](const fs::path &entry) {
    std::error_code ignored;
    return shape_of(entry.filename()) != shape || !fs::is_directory(fs::symlink_status(entry, ignored));
  });
  return folders;
}

}  // namespace

std::optional<double> free_percent(const std::string &folder) {
  struct statvfs disk {};
  if (statvfs(folder.c_str(), &disk) != 0 || disk.f_blocks == 0) return std::nullopt;
  return 100.0 * static_cast<double>(disk.f_bavail) / static_cast<double>(disk.f_blocks);
}

std::string delete_oldest_hour(const std::string &root, const std::set<std::string> &kept) {
  std::map<std::string, std::vector<fs::path>> hours;
  for (const recording::Kind kind : {recording::Kind::video, recording::Kind::audio})
    for (const fs::path &day : folders_of(recording::kind_folder(root, kind), "00000000"))
      for (const fs::path &channel : folders_of(day, "CH00"))
        for (const fs::path &file : entries_of(channel))
          if (const std::string hour = hour_in(file.filename()); !hour.empty() && kept.count(hour) == 0)
            hours[hour].push_back(file);
  std::error_code ignored;
  for (const auto &[hour, files] : hours) {
    bool any = false;
    std::set<fs::path> days;
    for (const fs::path &file : files) {
      any = fs::remove(file, ignored) || any;
      days.insert(file.parent_path().parent_path());
    }
    if (!any) continue;
    for (const fs::path &day : days) {
      for (const fs::path &channel : entries_of(day)) rmdir(channel.c_str());
      rmdir(day.c_str());
    }
    return hour;
  }
  return "";
}

}  // namespace recorder
