// Decodes frames to find damaged ones.
#include "frame_checker.h"

namespace clips {

FrameChecker::FrameChecker(ZV_VIDEO_CODEC codec)
    : picture_(libav::allocated(av_frame_alloc())), packet_(libav::allocated(av_packet_alloc())) {
  const AVCodec *const decoder =
      avcodec_find_decoder(codec == VIDEO_CODEC_ZV_MJPEG ? AV_CODEC_ID_MJPEG : AV_CODEC_ID_MPEG4);
  decoder_.reset(libav::allocated(avcodec_alloc_context3(decoder)));
  decoder_->thread_count = 1;
  decoder_->flags |= AV_CODEC_FLAG_LOW_DELAY;
  decoder_->err_recognition = AV_EF_EXPLODE | AV_EF_BITSTREAM | AV_EF_BUFFER;
  libav::checked(avcodec_open2(decoder_.get(), decoder, nullptr), "cannot decode");
}

std::size_t FrameChecker::whole_frames(const Group &group) {
  avcodec_flush_buffers(decoder_.get());
  std::size_t at = 0;
  for (std::size_t frame = 0; frame < group.sizes.size(); at += group.sizes[frame++])
    if (!decodes(group.data.subspan(at, group.sizes[frame]))) return frame;
  return group.sizes.size();
}

bool FrameChecker::decodes(std::span<const std::uint8_t> frame) {
  return libav::send(*decoder_, *packet_, frame) >= 0 &&
         avcodec_receive_frame(decoder_.get(), picture_.get()) >= 0 && picture_->decode_error_flags == 0;
}

}  // namespace clips
