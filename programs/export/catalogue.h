/**
 * @file catalogue.h
 * Finds recordings, and tells from their indexes what they hold.
 */
#ifndef EXPORT_CATALOGUE_H
#define EXPORT_CATALOGUE_H

#include <optional>
#include <string>
#include <vector>

#include "recording/index.h"
#include "recording/tree.h"
#include "report.h"
#include "wall_time.h"

namespace clips {

/// The dialog puts the first seconds of an hour at the end of the file before.
inline constexpr Milliseconds kLateChange = 60000;

/// What an index tells.
struct Contents {
  Stretch recorded;
  std::vector<Stretch> motion;
  std::vector<Stretch> gaps;
  std::int64_t lost_frames = 0;  ///< because the buffer was full
};

/// A recording: a part of a clock hour of a channel or of an audio input.
struct Recording {
  std::string path;
  unsigned number = 0;  ///< channel or input, from 1
  /// The clock hour that the index tells, or the name: of a name two hours, if the hour comes twice in
  /// autumn. None for another name.
  std::optional<Stretch> hour;
  unsigned part = 0;                         ///< 0 for the first file of the hour
  std::vector<recording::IndexEntry> index;  ///< empty if there is none
  Contents contents;                         ///< of a reduced index, and of a listed recording
  std::string doubt;                         ///< says which part of the index does not fit; mostly empty
  std::optional<Milliseconds> start;         ///< when the first frame was recorded, by the index
};

/// Returns a recording with its index; of its path, the last two names may tell channel and hour.
Recording recording_at(const std::string &path);

/// Reduced to its contents and last intra entry, an index of megabytes takes next to no memory.
enum class Indexes { kept, reduced };
/// Returns the recordings below a root in the order of channel, hour and part: those of one channel, or of
/// all for 0, whose hour overlaps a stretch. Throws std::runtime_error if the folder of video cannot be read;
/// that of audio may be missing.
std::vector<Recording> find_recordings(const std::string &root, recording::Kind kind, unsigned number,
                                       const Stretch &stretch, Indexes indexes = Indexes::kept);

/// Says if the index of a recording is not used, or only a part of it.
void note_doubt(const Recording &recording, Report &report);

/// The index must not be empty.
Contents contents_of(const std::vector<recording::IndexEntry> &index);

}  // namespace clips

#endif
