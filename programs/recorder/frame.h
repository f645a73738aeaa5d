/**
 * @file frame.h
 * A frame or an audio block on its way from the callback to its file.
 */
#ifndef RECORDER_FRAME_H
#define RECORDER_FRAME_H

#include <chrono>
#include <cstdint>
#include <string>

#include "zv_type.h"

namespace recorder {

/// The streams: video channels, then audio inputs.
inline constexpr unsigned kStreams = ZV_CHANNELS + ZV_AUDIO_CHANNELS;

constexpr bool is_video(unsigned stream) {
  return stream < ZV_CHANNELS;
}

/// Returns "channel 3" or "audio input 2".
inline std::string stream_name(unsigned stream) {
  return is_video(stream) ? "channel " + std::to_string(stream + 1)
                          : "audio input " + std::to_string(stream - ZV_CHANNELS + 1);
}

/// Returns the wall clock in milliseconds since 1970.
inline std::int64_t wall_ms() {
  const auto now = std::chrono::system_clock::now().time_since_epoch();
  return std::chrono::duration_cast<std::chrono::milliseconds>(now).count();
}

/// What stands in the buffer in front of the data of a frame.
struct Frame {
  std::int64_t time;     ///< wall clock, milliseconds since 1970
  std::uint32_t length;  ///< bytes of data
  std::uint32_t gap_ms;  ///< 0, or how long no frame of the stream had come
  std::uint32_t lost;    ///< frames of the stream that found the buffer full since the frame before
  std::uint8_t stream;
  bool intra;  ///< a reader can begin here; always set for Motion JPEG and audio
  bool motion;
  bool no_signal;

  const u8 *data() const { return reinterpret_cast<const u8 *>(this + 1); }
};

}  // namespace recorder

#endif
