/**
 * @file index.h
 * The index beside a recording: a line of JSON for each intra frame of video, for each second of audio, and
 * for each event. Readers of recordings work without it.
 */
#ifndef RECORDING_INDEX_H
#define RECORDING_INDEX_H

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace recording {

/// One line of an index.
struct IndexEntry {
  enum class Kind {
    intra,     ///< an intra frame or audio block; the counts are those of the group that it ends
    start,     ///< first line of a file: standard, rate, fields, audio
    stop,      ///< last line of a file; the counts of the last group
    gap,       ///< no frame came for `ms` milliseconds; `time` is when the frame after the gap came
    buffer,    ///< `frames` frames are lost because the buffer was full
    disk,      ///< the file could not be written: error
    standard,  ///< the video standard has changed
  };
  Kind kind = Kind::intra;
  std::int64_t time = 0;    ///< wall clock, milliseconds since 1970
  std::int64_t offset = 0;  ///< byte offset in the recording, with the header of video

  std::int64_t frames = 0;  ///< or blocks, since the last intra line of this file; 0 for the first
  std::int64_t bytes = 0;   ///< the same for bytes
  std::int64_t motion = 0;  ///< how many of these frames have motion
  std::int64_t lost = 0;    ///< how many of these frames have no video signal

  std::string standard;         ///< "ntsc" or "pal"
  std::string rate;             ///< a label of the frame-rate lists
  int fields = 1;               ///< 2: both fields of a frame are encoded, so frames come at twice the rate
  std::vector<unsigned> audio;  ///< numbers of the audio inputs that are recorded, from 1
  std::int64_t ms = 0;          ///< length of a gap
  std::string error;            ///< the system's text

  bool operator==(const IndexEntry &) const = default;
};

/// Returns a line with its line feed.
std::string to_line(const IndexEntry &entry);

/// Returns none for a torn line and for a line that is no entry.
std::optional<IndexEntry> parse_line(std::string_view line);

/// Returns the entries of a file in order, without the lines that parse_line() refuses; none for a file that
/// cannot be read.
std::vector<IndexEntry> read_index(const std::string &path);

/// Returns the path of the index that belongs to a recording: ".idx" instead of ".rec" or ".aud".
std::string index_path(const std::string &recording_path);

/// As much of an index as fits its recording: the dialog overwrites a recording but not its index.
struct FittingIndex {
  std::vector<IndexEntry> entries;
  /// The offset of the first entry that does not fit; that and all behind it are left out. If no entry is
  /// left, the index is that of another recording.
  std::optional<std::int64_t> misfit;
};
/// Reads the index beside a recording. A recording that cannot be read has all of its index.
FittingIndex fitting_index(const std::string &recording_path);

}  // namespace recording

#endif
