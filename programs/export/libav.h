/**
 * @file libav.h
 * Owners for the objects of libavcodec and libavformat.
 */
#ifndef EXPORT_LIBAV_H
#define EXPORT_LIBAV_H

#include <memory>
#include <new>
#include <stdexcept>
#include <string>

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
}

namespace clips {

struct LibavDeleter {
  void operator()(AVCodecContext *codec) const { avcodec_free_context(&codec); }
  void operator()(AVFrame *frame) const { av_frame_free(&frame); }
  void operator()(AVPacket *packet) const { av_packet_free(&packet); }
};
using CodecContext = std::unique_ptr<AVCodecContext, LibavDeleter>;
using FrameOwner = std::unique_ptr<AVFrame, LibavDeleter>;
using PacketOwner = std::unique_ptr<AVPacket, LibavDeleter>;

/// Passes an object on. Throws std::bad_alloc for null.
template <typename Object>
Object *allocated(Object *object) {
  if (object == nullptr) throw std::bad_alloc();
  return object;
}

/// Throws if a call has failed, for example "clip.mkv.part: No space left on device".
inline int checked(int result, const std::string &what) {
  if (result >= 0) return result;
  char text[AV_ERROR_MAX_STRING_SIZE] = {};
  av_strerror(result, text, sizeof text);
  throw std::runtime_error(what + ": " + text);
}

}  // namespace clips

#endif
