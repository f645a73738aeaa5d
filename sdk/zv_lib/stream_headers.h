/**
 * @file stream_headers.h
 * The headers that the SDK puts in front of the encoder's data: 20 bytes for an MPEG-4 intra frame, 593
 * bytes for a Motion-JPEG picture.
 */
#ifndef ZV_STREAM_HEADERS_H
#define ZV_STREAM_HEADERS_H

#include <array>

#include "zv_card.h"

namespace zarvo {

inline constexpr std::size_t kMpeg4HeaderSize = 20;
inline constexpr std::size_t kJpegHeaderSize = 593;

/// MPEG-4 visual object and video object layer; only the video data thread uses it.
extern std::array<u8, kMpeg4HeaderSize> g_mpeg4_header;

/// Writes the size of a channel's picture into g_mpeg4_header. Returns 0 on success, 1 when the channel is
/// not encoded, 2 when its scale is unknown. After 1 or 2 do not use the header.
int make_MP4_header(ZV_CARD &card, u32 channel);

using JpegHeader = std::array<u8, kJpegHeaderSize>;

/// Returns a complete JPEG header, from SOI to SOS.
JpegHeader jpeg_header_template();

/// Writes the frame header for a picture of `width` x `height`; uses the low 16 bits of each.
void jpeg_set_sof(JpegHeader &header, u32 width, u32 height);

}  // namespace zarvo

#endif
