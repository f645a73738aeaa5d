// Frees the objects of libav.
#include "av_ptr.h"

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
#include <libswscale/swscale.h>
}

namespace virtual_card {

void AvDeleter::operator()(AVFormatContext *input) const {
  avformat_close_input(&input);
}
void AvDeleter::operator()(AVCodecContext *codec) const {
  avcodec_free_context(&codec);
}
void AvDeleter::operator()(AVFrame *frame) const {
  av_frame_free(&frame);
}
void AvDeleter::operator()(AVPacket *packet) const {
  av_packet_free(&packet);
}
void AvDeleter::operator()(SwsContext *scaler) const {
  sws_freeContext(scaler);
}

}  // namespace virtual_card
