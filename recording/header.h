/**
 * @file header.h
 * The header of a video recording.
 */
#ifndef RECORDING_HEADER_H
#define RECORDING_HEADER_H

#include <bit>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "zv_type.h"

/// The first 32 bytes of a ".rec" file; the stream follows. Integers are little-endian.
struct RECORD_FILE_HEADER {
  char codec_tag[4];           ///< "MPG4" or "MJPG", no terminator
  std::int32_t record_width;   ///< pixels
  std::int32_t record_height;  ///< lines
  std::int32_t frame_rate;     ///< frames a second, truncated to a whole number; 0 when unknown
  char channel_label[16];      ///< "Channel 1" to "Channel 16", padded with zero bytes
};

static_assert(sizeof(RECORD_FILE_HEADER) == 32 && offsetof(RECORD_FILE_HEADER, channel_label) == 16);
static_assert(std::endian::native == std::endian::little, "the header is written without byte swapping");

namespace recording {

struct PictureSize {
  int width;
  int height;
};
/// Returns the size of the recorded picture. `scale` must not be SCALE_ZV_NO_ENCODE.
PictureSize picture_size(ZV_SCALE_VALUE scale, ZV_VIDEO_STANDARD standard, ZV_RESOLUTION resolution);

/// Builds a header. `rate` is a label of the frame-rate lists; `channel` counts from 0.
RECORD_FILE_HEADER make_header(ZV_VIDEO_CODEC codec, PictureSize size, const std::string &rate,
                               unsigned channel);

/// Reads a header at the current position of a file. Returns none when the file is too short.
std::optional<RECORD_FILE_HEADER> read_header(int file);
/// Returns the codec of a header; none for an unknown tag: the file is then not a recording.
std::optional<ZV_VIDEO_CODEC> codec_of(const RECORD_FILE_HEADER &header);
/// Returns the bytes that each intra frame of a recording begins with.
std::string_view intra_start(ZV_VIDEO_CODEC codec);
std::string label_of(const RECORD_FILE_HEADER &header);
/// Returns the standard that the picture's height tells.
ZV_VIDEO_STANDARD standard_of(const RECORD_FILE_HEADER &header);

}  // namespace recording

#endif
