/**
 * @file libav.h
 * Owners for the objects of libavcodec, and its errors as exceptions. A program that includes this links
 * libavcodec.
 */
#ifndef LIBAV_H
#define LIBAV_H

#include <algorithm>
#include <cstdint>
#include <memory>
#include <new>
#include <span>
#include <stdexcept>
#include <string>

extern "C" {
#include <libavcodec/avcodec.h>
}

namespace libav {

struct Deleter {
  void operator()(AVCodecContext *codec) const { avcodec_free_context(&codec); }
  void operator()(AVFrame *frame) const { av_frame_free(&frame); }
  void operator()(AVPacket *packet) const { av_packet_free(&packet); }
};
using CodecContext = std::unique_ptr<AVCodecContext, Deleter>;
using FrameOwner = std::unique_ptr<AVFrame, Deleter>;
using PacketOwner = std::unique_ptr<AVPacket, Deleter>;

/// Passes an object on. Throws std::bad_alloc for null.
template <typename Object>
Object *allocated(Object *object) {
  if (object == nullptr) throw std::bad_alloc();
  return object;
}

/// Whether a decoded picture consists of two fields. Later versions of the library have a flag for it.
inline bool is_interlaced(const AVFrame &frame) {
#ifdef AV_FRAME_FLAG_INTERLACED
  return (frame.flags & AV_FRAME_FLAG_INTERLACED) != 0;
#else
  return frame.interlaced_frame != 0;
#endif
}

/// Throws if a call has failed, for example "clip.mkv.part: No space left on device".
inline int checked(int result, const std::string &what) {
  if (result >= 0) return result;
  char text[AV_ERROR_MAX_STRING_SIZE] = {};
  av_strerror(result, text, sizeof text);
  throw std::runtime_error(what + ": " + text);
}

/// Sends a copy of data to a decoder; `packet` is for the copy. Returns what avcodec_send_packet() does.
inline int send(AVCodecContext &decoder, AVPacket &packet, std::span<const std::uint8_t> data) {
  checked(av_new_packet(&packet, static_cast<int>(data.size())), "cannot decode");
  std::ranges::copy(data, packet.data);
  const int result = avcodec_send_packet(&decoder, &packet);
  av_packet_unref(&packet);
  return result;
}

}  // namespace libav

#endif
