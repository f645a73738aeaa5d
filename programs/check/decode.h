/**
 * @file decode.h
 * Decodes what the SDK delivers.
 */
#ifndef CONTRACT_DECODE_H
#define CONTRACT_DECODE_H

#include <cstdint>
#include <optional>

#include "image.h"
#include "recording.h"

namespace contract {

struct Decoded {
  std::size_t pictures = 0;
  std::size_t errors = 0;  ///< frames that the decoder refuses or has to repair
  u32 width = 0;           ///< of the last picture
  u32 height = 0;
  bool interlaced = false;
  bool one_size = true;
  Image last;
};

/// Decodes a track of MPEG-4 frames from its first frame on.
Decoded decode_mpeg4(const Track &track);
/// Decodes a track of Motion-JPEG pictures.
Decoded decode_mjpeg(const Track &track);
/// Decodes one Motion-JPEG picture; empty if that fails.
Image decode_jpeg(const Frame &frame);

/// Decodes audio blocks; 8000 samples a second.
std::vector<std::int16_t> decode_audio(const Track &track);

}  // namespace contract

#endif
