/**
 * @file header.h
 * The header of every video recording.
 */
#ifndef RECORDING_HEADER_H
#define RECORDING_HEADER_H

#include <bit>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

#include "zv_type.h"

/// 32 bytes at the start of a ".rec" file, integers little-endian. The stream follows at once.
struct RECORD_FILE_HEADER {
  char codec_tag[4];           ///< "MPG4" or "MJPG", no terminator
  std::int32_t record_width;   ///< pixels
  std::int32_t record_height;  ///< lines
  std::int32_t frame_rate;     ///< frames a second, cut to a whole number; 0 when not known
  char channel_label[16];      ///< "Channel 1" to "Channel 16", padded with zero bytes
};

static_assert(sizeof(RECORD_FILE_HEADER) == 32 && offsetof(RECORD_FILE_HEADER, channel_label) == 16);
static_assert(std::endian::native == std::endian::little, "the header goes to the file as it stands");

namespace recording {

struct PictureSize {
  int width;
  int height;
};
/// Size of the recorded picture. `scale` is not SCALE_ZV_NO_ENCODE.
PictureSize picture_size(ZV_SCALE_VALUE scale, ZV_VIDEO_STANDARD standard, ZV_RESOLUTION resolution);

/// `rate` is a label of the frame-rate lists; `channel` counts from 0.
RECORD_FILE_HEADER make_header(ZV_VIDEO_CODEC codec, PictureSize size, const std::string &rate,
                               unsigned channel);

/// The header at the current place of a file; none when the file is too short.
std::optional<RECORD_FILE_HEADER> read_header(int file);
/// None for an unknown tag: the file is no recording.
std::optional<ZV_VIDEO_CODEC> codec_of(const RECORD_FILE_HEADER &header);
std::string label_of(const RECORD_FILE_HEADER &header);

}  // namespace recording

#endif
