// Finds recordings, and reads their indexes.
#include "catalogue.h"

#include <algorithm>
#include <filesystem>
#include <tuple>

namespace clips {
namespace {

namespace fs = std::filesystem;
using recording::IndexEntry;
using Kind = IndexEntry::Kind;

Recording named(const fs::path &path) {
  Recording recording;
  recording.path = path;
  if (const auto channel = recording::parse_channel_folder(path.parent_path().filename()))
    recording.number = *channel + 1;
  if (const auto name = recording::parse_file_name(path.filename())) {
    recording.hour = from_local(name->hour);
    recording.part = name->part;
  }
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

}  // namespace

Recording recording_at(const std::string &path) {
  Recording recording = named(fs::absolute(path));
  recording.path = path;
  read_index_of(recording);
  return recording;
}

std::vector<Recording> find_recordings(const std::string &root, recording::Kind kind, unsigned number,
                                       const Stretch &stretch) {
  const fs::path folder = recording::kind_folder(root, kind);
  if (!fs::is_directory(folder)) throw std::runtime_error(folder.string() + " is not a folder");
  std::vector<Recording> found;
  for (const fs::path &day : entries_of(folder)) {
    for (const fs::path &channel : entries_of(day)) {
      const auto own = recording::parse_channel_folder(channel.filename());
      if (!own || (number != 0 && *own + 1 != number)) continue;
      for (const fs::path &file : entries_of(channel)) {
        if (file.extension() != recording::extension_of(kind)) continue;
        Recording recording = named(file);
        if (!recording.hour) continue;
        if (stretch.overlaps({*recording.hour, *recording.hour + kHour + kLateChange}))
          found.push_back(std::move(recording));
      }
    }
  }
  for (Recording &recording : found) read_index_of(recording);
  std::ranges::sort(found, {}, [](const Recording &r) {
    return std::tuple(r.number, r.index.empty() ? *r.hour : recording::hour_begin(r.index.front().time),
                      r.part);
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
