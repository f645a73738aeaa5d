// Finds recordings, and reads their indexes.
#include "catalogue.h"

#include <algorithm>
#include <charconv>
#include <filesystem>
#include <tuple>

namespace clips {
namespace {

namespace fs = std::filesystem;
using recording::IndexEntry;
using Kind = IndexEntry::Kind;

/// Reads a whole number of decimal digits.
std::optional<int> number_in(std::string_view digits) {
  int number = 0;
  const auto [end, error] = std::from_chars(digits.data(), digits.data() + digits.size(), number);
  if (error != std::errc{} || end != digits.data() + digits.size() || number < 0) return std::nullopt;
  return number;
}

/// Reads "20261125-14" or, for a further part of the hour, "20261125-14.1".
void read_name(std::string_view name, Recording &recording) {
  const std::size_t dot = std::min(name.find('.'), name.size());
  const std::string_view hour = name.substr(0, dot);
  const auto day = number_in(hour.substr(0, 8));
  if (hour.size() != 11 || hour[8] != '-' || !day || !number_in(hour.substr(9))) return;
  const auto part = dot == name.size() ? 0 : number_in(name.substr(dot + 1));
  if (!part) return;
  std::tm fields{};
  fields.tm_year = *day / 10000 - 1900;
  fields.tm_mon = *day / 100 % 100 - 1;
  fields.tm_mday = *day % 100;
  fields.tm_hour = *number_in(hour.substr(9));
  recording.hour = from_local(fields);
  recording.part = static_cast<unsigned>(*part);
}

unsigned number_of_folder(const std::string &name) {
  return name.size() == 4 && name.starts_with("CH")
             ? static_cast<unsigned>(number_in(name.substr(2)).value_or(0))
             : 0;
}

Recording named(const fs::path &path) {
  Recording recording;
  recording.path = path;
  recording.number = number_of_folder(path.parent_path().filename());
  read_name(path.stem().string(), recording);
  return recording;
}

void read_index_of(Recording &recording) {
  if (recording.path.ends_with(".rec"))
    recording.index = recording::read_index(recording::index_path(recording.path));
  // Without an intra frame it tells no time of a frame.
  if (std::ranges::none_of(recording.index,
                           [](const IndexEntry &entry) { return entry.kind == Kind::intra; }))
    recording.index.clear();
  else
    recording.start = recording.index.front().time;
}

std::vector<fs::path> entries_of(const fs::path &folder) {
  std::error_code error;
  std::vector<fs::path> paths;
  for (const auto &entry : fs::directory_iterator(folder, error)) paths.push_back(entry.path());
  return paths;
}

/// Adds a stretch, to the last one if they touch.
void append(std::vector<Stretch> &stretches, const Stretch &stretch) {
  if (!stretches.empty() && stretches.back().to >= stretch.from)
    stretches.back().to = std::max(stretches.back().to, stretch.to);
  else
    stretches.push_back(stretch);
}

}  // namespace

Recording recording_at(const std::string &path) {
  Recording recording = named(fs::absolute(path));
  recording.path = path;
  read_index_of(recording);
  return recording;
}

std::vector<Recording> find_recordings(const std::string &root, recording::Kind kind, unsigned number,
                                       const Stretch &stretch) {
  const bool video = kind == recording::Kind::video;
  const fs::path folder = fs::path(root) / (video ? "Video" : "Audio");
  if (!fs::is_directory(folder)) throw std::runtime_error(folder.string() + " is not a folder");
  std::vector<Recording> found;
  for (const fs::path &day : entries_of(folder)) {
    for (const fs::path &channel : entries_of(day)) {
      const unsigned own = number_of_folder(channel.filename());
      if (own == 0 || (number != 0 && own != number)) continue;
      for (const fs::path &file : entries_of(channel)) {
        if (file.extension() != (video ? ".rec" : ".aud")) continue;
        Recording recording = named(file);
        if (!recording.hour) continue;
        if (stretch.overlaps({*recording.hour, *recording.hour + kHour + kLateChange}))
          found.push_back(std::move(recording));
      }
    }
  }
  for (Recording &recording : found) read_index_of(recording);
  std::ranges::sort(found, {}, [](const Recording &r) {
    return std::tuple(r.number, r.index.empty() ? *r.hour : hour_of(r.index.front().time), r.part);
  });
  return found;
}

Contents contents_of(const std::vector<IndexEntry> &index) {
  Contents contents;
  contents.recorded = {index.front().time, index.front().time};
  Milliseconds group = index.front().time;  // its start
  Milliseconds length = 0;                  // of the last whole group
  bool ended = false;
  for (const IndexEntry &entry : index) {
    if (entry.kind == Kind::gap) append(contents.gaps, {entry.time - entry.ms, entry.time});
    if (entry.kind == Kind::buffer) contents.lost_frames += entry.frames;
    if (entry.kind != Kind::intra && entry.kind != Kind::stop) continue;
    if (entry.motion > 0) append(contents.motion, {group, entry.time});
    length = entry.time - group;
    group = entry.time;
    ended = entry.kind == Kind::stop;
  }
  // A recorder that was killed leaves no stop line: the last group is unknown. It counts as long as the group
  // before, and as motion if that had motion, so that --motion loses nothing.
  contents.recorded.to = ended ? group : group + length;
  if (!ended && !contents.motion.empty() && contents.motion.back().to == group)
    contents.motion.back().to += length;
  return contents;
}

}  // namespace clips
