/**
 * @file audio_reader.h
 * Reads the blocks of an audio input, and says at what wall-clock time each was recorded.
 */
#ifndef EXPORT_AUDIO_READER_H
#define EXPORT_AUDIO_READER_H

#include <array>
#include <fstream>
#include <vector>

#include "aac_encoder.h"
#include "catalogue.h"
#include "report.h"

namespace clips {

/// Blocks of a file that follow each other without a gap.
struct AudioRun {
  std::size_t file;                    ///< its number in the list of recordings
  std::int64_t block = 0, blocks = 0;  ///< the number of the first, and how many
  Milliseconds start = 0;              ///< when the first one begins
  bool set_back = false;               ///< by a clock that was set back in front of it
  Milliseconds end() const;
};
/// Returns the runs of audio files, which are in order. The index of a file tells when they were recorded.
/// Without one, the video of the same hour tells when the file begins, its length when it ends.
std::vector<AudioRun> audio_runs(const std::vector<Recording> &audio, const std::vector<Recording> &video);

struct AudioBlock {
  Milliseconds time = 0;
  std::array<char, kBlockBytes> data{};
};

class AudioReader {
 public:
  /// See audio_runs(). Leaves out what ends before `from`. Reports blocks that are torn.
  AudioReader(const std::vector<Recording> &audio, const std::vector<Recording> &video, Milliseconds from,
              Report &report);

  /// Goes on at the first block that begins at a time or behind it, since the clock was last set back.
  void seek(Milliseconds time);
  /// The clock was set back once more: seek() looks behind the next run that it shows in.
  void set_back();
  /// Reads the next block if it begins before `until`, up to where the clock was set back. Reports runs that
  /// cannot be read, and leaves them out.
  bool next(AudioBlock &block, Milliseconds until);

 private:
  std::vector<std::string> paths_;
  std::vector<AudioRun> runs_;
  Report &report_;
  std::size_t pass_ = 0;    ///< the first run since the clock was last set back
  std::size_t run_ = 0;     ///< the run of the next block
  std::int64_t block_ = 0;  ///< its number in the run
  std::ifstream stream_;    ///< the file of the run, open behind its first block that was read
};

}  // namespace clips

#endif
