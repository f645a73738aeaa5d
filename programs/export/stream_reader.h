/**
 * @file stream_reader.h
 * Splits a video recording into groups of frames: an intra frame and the frames up to the next one. A JPEG
 * picture is a group of its own.
 */
#ifndef EXPORT_STREAM_READER_H
#define EXPORT_STREAM_READER_H

#include <cstdint>
#include <optional>
#include <span>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "recording/header.h"

namespace clips {

/// Thrown for a recording that cannot be read.
struct RecordingError : std::runtime_error {
  using std::runtime_error::runtime_error;
};

struct Group {
  std::int64_t offset = 0;             ///< in the file
  std::span<const std::uint8_t> data;  ///< the frames without a gap; valid until the reader goes on
  std::vector<std::size_t> sizes;      ///< bytes of each frame
  std::size_t lost = 0;                ///< damaged frames behind these, and the frames that need them
  bool last = false;                   ///< the file ends with it

  /// Keeps the first frames; the others count as lost.
  void keep(std::size_t frames);
  std::int64_t end() const { return offset + static_cast<std::int64_t>(data.size()); }
};

class StreamReader {
 public:
  /// Opens a recording. Throws RecordingError if it is none.
  explicit StreamReader(const std::string &path);
  ~StreamReader();
  StreamReader(const StreamReader &) = delete;
  StreamReader &operator=(const StreamReader &) = delete;

  const RECORD_FILE_HEADER &header() const { return header_; }
  ZV_VIDEO_CODEC codec() const { return codec_; }

  /// Goes on at an offset of the file, or at the first intra frame behind it.
  void seek(std::int64_t offset);
  /// Reads the next group. Returns false at the end. Bytes in front of the intra frame that belong to no
  /// group come as a group without frames. Throws RecordingError.
  bool next(Group &group);

 private:
  bool fill();
  bool has(std::size_t at) { return at < filled_ || (fill() && has(at)); }
  int find_start_code(std::size_t &at);
  bool at_intra();
  std::size_t find_intra(std::size_t at);
  std::size_t split_mpeg4(Group &group);
  std::size_t split_jpeg(Group &group);
  std::optional<std::size_t> end_of_jpeg();

  std::string path_;
  RECORD_FILE_HEADER header_;
  ZV_VIDEO_CODEC codec_;
  std::string_view intra_;  ///< what an intra frame begins with
  int file_;
  bool ended_ = false;
  std::vector<std::uint8_t> buffer_;
  std::size_t filled_ = 0;          ///< bytes of the buffer that hold data
  std::size_t start_ = 0;           ///< where in the buffer the next group begins
  std::int64_t buffer_offset_ = 0;  ///< offset in the file of the buffer's first byte
};

}  // namespace clips

#endif
