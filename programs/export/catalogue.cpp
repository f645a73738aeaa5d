// Finds recordings, and reads their indexes.
#include "catalogue.h"

#include <algorithm>
#include <filesystem>
#include <tuple>

namespace clips {
namespace {

/// The recorder begins a new hour with an intra frame: at one frame a second up to 300 frames late.
constexpr Milliseconds kLongestGroup = 302000;

namespace fs = std::filesystem;
using recording::IndexEntry;
using Kind = IndexEntry::Kind;

Recording named(const fs::path &path) {
  Recording recording;
  recording.path = path;
  if (const auto channel = recording::parse_channel_folder(path.parent_path().filename()))
    recording.number = *channel + 1;
  if (const auto name = recording::parse_file_name(path.filename())) {
    recording.hour = {from_local(name->hour, Pass::first), from_local(name->hour, Pass::second) + kHour};
    recording.part = name->part;
  }
  return recording;
}

void read_index_of(Recording &recording) {
  auto [index, misfit] = recording::fitting_index(recording.path);
  if (misfit)
    recording.doubt =
        recording.path + (index.empty() ? ": its index belongs to another recording: not used"
                                        : ": its index does not fit from byte " + std::to_string(*misfit) +
                                              " on: not used from there");
  // Without an intra frame it tells no time of a frame.
  if (std::ranges::none_of(index, [](const IndexEntry &entry) { return entry.kind == Kind::intra; })) return;
  recording.start = index.front().time;
  const Milliseconds hour = recording::hour_begin(*recording.start);
  recording.hour = {hour, hour + kHour};
  recording.index = std::move(index);
}

void reduce_index_of(Recording &recording) {
  if (recording.index.empty()) return;
  recording.contents = contents_of(recording.index);
  const auto last =
      std::ranges::find(recording.index.rbegin(), recording.index.rend(), Kind::intra, &IndexEntry::kind);
  recording.index = std::vector<IndexEntry>{*last};
}

bool may_overlap(const Recording &recording, const Stretch &stretch, Milliseconds late) {
  return recording.hour && stretch.overlaps({recording.hour->from, recording.hour->to + late});
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
                                       const Stretch &stretch, Indexes indexes) {
  const fs::path folder = recording::kind_folder(root, kind);
  if (kind == recording::Kind::video && !fs::is_directory(folder))
    throw std::runtime_error(folder.string() + " is not a folder");
  std::vector<Recording> found;
  for (const fs::path &day : entries_of(folder)) {
    for (const fs::path &channel : entries_of(day)) {
      const auto own = recording::parse_channel_folder(channel.filename());
      if (!own || (number != 0 && *own + 1 != number)) continue;
      for (const fs::path &file : entries_of(channel)) {
        if (file.extension() != recording::extension_of(kind)) continue;
        Recording recording = named(file);
        if (!may_overlap(recording, stretch, kLongestGroup)) continue;
        read_index_of(recording);
        if (!may_overlap(recording, stretch, recording.index.empty() ? kLateChange : kLongestGroup)) continue;
        if (indexes == Indexes::reduced) reduce_index_of(recording);
        found.push_back(std::move(recording));
      }
    }
  }
  std::ranges::sort(found, {}, [](const Recording &r) { return std::tuple(r.number, r.hour->from, r.part); });
  return found;
}

void note_doubt(const Recording &recording, Report &report) {
  if (!recording.doubt.empty()) report.note(recording.doubt);
}

Contents contents_of(const std::vector<IndexEntry> &index) {
  Contents contents;
  contents.recorded = {index.front().time, index.front().time};
  Milliseconds group = index.front().time;  // its start
  Milliseconds length = 0;                  // of the last whole group
  std::int64_t gap = -1;                    // where the last gap is
  bool ended = false;
  for (const IndexEntry &entry : index) {
    if (entry.kind == Kind::gap) {
      append(contents.gaps, {entry.time - entry.ms, entry.time});
      gap = entry.offset;
    }
    if (entry.kind == Kind::buffer) contents.lost_frames += entry.frames;
    if (entry.kind != Kind::intra && entry.kind != Kind::stop) continue;
    // A group in front of a gap ends where the gap begins.
    const Milliseconds end = gap == entry.offset ? std::max(group, contents.gaps.back().from) : entry.time;
    if (entry.motion > 0) append(contents.motion, {group, end});
    length = end - group;
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
