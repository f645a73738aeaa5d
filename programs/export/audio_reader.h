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

/// Returns when each audio file was recorded. They have no index: the video files of the same hour tell when
/// one begins, its length when it ends. The audio files are in order.
std::vector<Stretch> audio_stretches(const std::vector<Recording> &audio,
                                     const std::vector<Recording> &video);

struct AudioBlock {
  Milliseconds time = 0;
  std::array<char, kBlockBytes> data{};
};

class AudioReader {
 public:
  /// See audio_stretches(). Leaves out the files that end before `from`. Reports blocks that are torn.
  AudioReader(const std::vector<Recording> &audio, const std::vector<Recording> &video, Milliseconds from,
              Report &report);

  /// Goes on at the first block that begins at a time or behind it.
  void seek(Milliseconds time);
  /// Reads the next block if it begins before `until`.
  bool next(AudioBlock &block, Milliseconds until);

 private:
  struct File {
    std::string path;
    Stretch recorded;
    std::int64_t blocks;
  };

  std::vector<File> files_;
  std::size_t file_ = 0;    ///< the file of the next block
  std::int64_t block_ = 0;  ///< its number in the file
  std::ifstream stream_;    ///< the file, open behind its first block that was read
};

}  // namespace clips

#endif
