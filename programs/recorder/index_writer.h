/**
 * @file index_writer.h
 * Writes the index beside a recording while the recording grows.
 */
#ifndef RECORDER_INDEX_WRITER_H
#define RECORDER_INDEX_WRITER_H

#include <cstdint>
#include <string>
#include <vector>

#include "frame.h"
#include "recording/index.h"

namespace recorder {

class IndexWriter {
 public:
  /// `start` describes the recording, `period` is the time of a frame in milliseconds. A group has at least
  /// `least_group` frames, unless a loss or a gap ends it.
  IndexWriter(recording::IndexEntry start, std::int64_t period, std::int64_t least_group)
      : start_(std::move(start)), period_(period), least_group_(least_group) {}

  /// Begins the index of a new file with the frame that it begins with. Takes the descriptor over.
  void begin(int file, std::int64_t time, std::int64_t offset);
  /// Adds what a frame tells. `offset` is the place of the frame in its file, `lost` how many frames are
  /// missing in front of it because the buffer was full.
  void add_frame(const Frame &frame, std::int64_t offset, std::uint32_t lost);
  /// Adds a silence that lasts until now, and that the file ends with.
  void add_last_gap(std::int64_t time, std::int64_t offset, std::uint32_t gap_ms);
  /// Adds the frames that are lost behind the last frame of the file.
  void add_last_loss(std::int64_t offset, std::uint32_t lost);
  /// Without an index the event goes into the next.
  void add_disk_error(std::int64_t time, std::int64_t offset, const std::string &error);
  /// Adds the last line, and writes. Its time is the end of the last frame or gap: that of the next frame can
  /// be much later. Returns the descriptor, which is the caller's again.
  int end(std::int64_t offset);

  /// Writes the lines that are not yet in the file. What the disk does not take is written by a later call.
  void write();
  /// Returns the errno of a write that failed, once for each file; else 0.
  int take_error();

 private:
  void add(recording::IndexEntry::Kind kind, std::int64_t time, std::int64_t offset);
  void add(const recording::IndexEntry &entry);

  recording::IndexEntry start_;
  const std::int64_t period_, least_group_;
  int file_ = -1;
  std::int64_t end_ = 0;                      ///< when the last frame or gap ended
  std::string text_;                          ///< lines that are not yet in the file
  std::vector<recording::IndexEntry> early_;  ///< events that came while there was no index
  int error_ = 0;                             ///< of a write, until it is taken
  bool error_taken_ = false;                  ///< in this file
  recording::IndexEntry group_;               ///< the counts since the last intra line
};

}  // namespace recorder

#endif
