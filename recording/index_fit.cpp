// Tells how much of an index fits its recording.
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <string_view>

#include "recording/header.h"
#include "recording/index.h"

namespace recording {
namespace {

using Kind = IndexEntry::Kind;

/// The most bytes of audio, a minute, that a power cut leaves behind the last line of an index: the recorder
/// does not sync indexes, and the system writes them within half a minute.
constexpr std::int64_t kMostBehind = 180000;

struct Recorded {
  int file;
  std::int64_t size;
  std::string_view intra;  ///< what an intra frame begins with

  /// Whether an entry tells the truth about a place in the file. Events tell about none.
  bool fits(const IndexEntry &entry) const {
    if (entry.kind == Kind::stop) return entry.offset == size;
    char bytes[16];
    return pread(file, bytes, intra.size(), entry.offset) == static_cast<ssize_t>(intra.size()) &&
           std::string_view(bytes, intra.size()) == intra;
  }
};

/// Returns the first of the positions in `entries` whose entry does not fit.
auto first_misfit(const std::vector<IndexEntry> &entries, const std::vector<std::size_t> &positions,
                  const Recorded &recorded) {
  const auto fits = [&](std::size_t position) { return recorded.fits(entries[position]); };
  if (positions.size() < 2) return positions.end();
  // Every recording has an intra frame where the first one is: the second one tells whose index this is.
  if (!fits(positions[1])) return positions.begin() + 1;
  // Between entries that fit all others do. To read each of them would take a slow disk minutes.
  return fits(positions.back()) ? positions.end() : std::ranges::partition_point(positions, fits);
}

void fit_video(FittingIndex &index, const Recorded &recorded) {
  std::vector<std::size_t> positions;
  for (std::size_t position = 0; position < index.entries.size(); ++position)
    if (index.entries[position].kind == Kind::intra || index.entries[position].kind == Kind::stop)
      positions.push_back(position);
  const auto misfit = first_misfit(index.entries, positions, recorded);
  if (misfit == positions.end()) return;
  index.misfit = index.entries[*misfit].offset;
  index.entries.resize(misfit - positions.begin() < 2 ? 0 : *misfit);
}

/// Audio blocks look all the same, so that the index of another recording shows only by its end.
void fit_audio(FittingIndex &index, std::int64_t size) {
  if (index.entries.empty()) return;
  const IndexEntry &last = index.entries.back();
  const std::int64_t behind = size - last.offset;
  if (behind >= 0 && behind <= (last.kind == Kind::stop ? 0 : kMostBehind)) return;
  index.misfit = last.offset;
  index.entries.clear();
}

}  // namespace

FittingIndex fitting_index(const std::string &recording_path) {
  FittingIndex index{read_index(index_path(recording_path)), {}};
  const int file = open(recording_path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC);
  if (file < 0) return index;
  struct stat info {};
  fstat(file, &info);
  if (recording_path.ends_with(".aud")) {
    fit_audio(index, info.st_size);
  } else if (const auto header = read_header(file)) {
    if (const auto codec = codec_of(*header)) fit_video(index, {file, info.st_size, intra_start(*codec)});
  }
  close(file);
  return index;
}

}  // namespace recording
