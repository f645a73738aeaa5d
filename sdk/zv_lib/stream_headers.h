/**
 * @file stream_headers.h
 * Headers the SDK puts in front of what the encoder delivers: 20 bytes for an MPEG-4 intra frame,
 * 593 bytes for a Motion-JPEG picture.
 */
#ifndef ZV_STREAM_HEADERS_H
#define ZV_STREAM_HEADERS_H

#include <array>

#include "zv_card.h"

namespace zarvo {

inline constexpr std::size_t kMpeg4HeaderSize = 20;
inline constexpr std::size_t kJpegHeaderSize = 593;

/// MPEG-4 visual object and video object layer; used by the video data thread only.
extern std::array<u8, kMpeg4HeaderSize> g_mpeg4_header;

/// Makes g_mpeg4_header describe a channel's picture. 0 on success; 1 when the channel is not
/// encoded, 2 when its scale is unknown: the header is not to be used then.
int make_MP4_header(ZV_CARD &card, u32 channel);

using JpegHeader = std::array<u8, kJpegHeaderSize>;

/// A whole JPEG header, from SOI to SOS.
JpegHeader jpeg_header_template();

/// Writes the frame header for a picture of `width` x `height`, 16 bits each.
void jpeg_set_sof(JpegHeader &header, u32 width, u32 height);

}  // namespace zarvo

#endif
