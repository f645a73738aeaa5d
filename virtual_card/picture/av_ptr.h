/**
 * @file av_ptr.h
 * Owning pointers to objects of libav.
 */
#ifndef VIRTUAL_CARD_AV_PTR_H
#define VIRTUAL_CARD_AV_PTR_H

#include <memory>

struct AVCodecContext;
struct AVFormatContext;
struct AVFrame;
struct AVPacket;
struct SwsContext;

namespace virtual_card {

struct AvDeleter {
  void operator()(AVFormatContext *input) const;
  void operator()(AVCodecContext *codec) const;
  void operator()(AVFrame *frame) const;
  void operator()(AVPacket *packet) const;
  void operator()(SwsContext *scaler) const;
};
template <typename Object>
using AvPtr = std::unique_ptr<Object, AvDeleter>;

}  // namespace virtual_card

#endif
