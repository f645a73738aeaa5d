/**
 * @file record_file_header.h
 * The header of every video recording file, shared by the recorder and the player.
 */
#ifndef RECORD_FILE_HEADER_H
#define RECORD_FILE_HEADER_H

#include <bit>
#include <cstddef>
#include <cstdint>

/// 32 bytes at the start of a ".rec" file, integers little-endian. The stream follows at once.
struct RECORD_FILE_HEADER {
  char codec_tag[4];           ///< "MPG4" or "MJPG", no terminator
  std::int32_t record_width;   ///< pixels
  std::int32_t record_height;  ///< lines
  std::int32_t frame_rate;     ///< frames a second, truncated; 0 when not known
  char channel_label[16];      ///< "Channel 1" to "Channel 16", padded with zero bytes
};

static_assert(sizeof(RECORD_FILE_HEADER) == 32 && offsetof(RECORD_FILE_HEADER, channel_label) == 16);
static_assert(std::endian::native == std::endian::little, "the header goes to the file as it stands");

inline constexpr char kMpeg4Tag[] = "MPG4";
inline constexpr char kMjpegTag[] = "MJPG";

#endif
