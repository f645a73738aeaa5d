// Turns G.726 into AAC.
#include "aac_encoder.h"

#include <algorithm>
#include <utility>

namespace clips {
namespace {

using libav::allocated, libav::checked;

libav::CodecContext open_codec(const AVCodec *codec, bool global_header) {
  if (codec == nullptr)
    throw std::runtime_error("libavcodec has no AAC encoder; write an .mkv, or leave out --audio");
  libav::CodecContext context(allocated(avcodec_alloc_context3(codec)));
  context->sample_rate = kSampleRate;
  av_channel_layout_default(&context->ch_layout, 1);
  context->time_base = {1, kSampleRate};
  context->bits_per_coded_sample = kSampleBits;
  context->sample_fmt = AV_SAMPLE_FMT_FLTP;
  context->bit_rate = 32000;
  if (global_header) context->flags |= AV_CODEC_FLAG_GLOBAL_HEADER;
  checked(avcodec_open2(context.get(), codec, nullptr), codec->name);
  return context;
}

}  // namespace

AacEncoder::AacEncoder(Sink sink)
    : sink_(std::move(sink)),
      decoder_(open_codec(avcodec_find_decoder(AV_CODEC_ID_ADPCM_G726), false)),
      encoder_(open_codec(avcodec_find_encoder(AV_CODEC_ID_AAC), true)),
      decoded_(allocated(av_frame_alloc())),
      frame_(allocated(av_frame_alloc())),
      packet_(allocated(av_packet_alloc())) {}

void AacEncoder::add(std::span<const std::uint8_t> block, std::int64_t sample) {
  while (encoded_ + static_cast<std::int64_t>(waiting_.size()) < sample) {
    const std::int64_t missing = sample - encoded_ - static_cast<std::int64_t>(waiting_.size());
    waiting_.resize(waiting_.size() + static_cast<std::size_t>(std::min<std::int64_t>(missing, kSampleRate)));
    encode_whole_frames();
  }
  checked(libav::send(*decoder_, *packet_, block), "audio");
  while (avcodec_receive_frame(decoder_.get(), decoded_.get()) >= 0) {
    const auto *const samples = reinterpret_cast<const std::int16_t *>(decoded_->data[0]);
    for (int i = 0; i < decoded_->nb_samples; ++i) waiting_.push_back(static_cast<float>(samples[i]) / 32768);
  }
  encode_whole_frames();
}

void AacEncoder::finish() {
  if (!waiting_.empty()) encode(waiting_.size());
  checked(avcodec_send_frame(encoder_.get(), nullptr), "audio");
  take_packets();
}

void AacEncoder::encode_whole_frames() {
  const auto size = static_cast<std::size_t>(encoder_->frame_size);
  while (waiting_.size() >= size) encode(size);
}

void AacEncoder::encode(std::size_t samples) {
  av_frame_unref(frame_.get());
  frame_->format = AV_SAMPLE_FMT_FLTP;
  frame_->sample_rate = kSampleRate;
  frame_->nb_samples = static_cast<int>(samples);
  frame_->pts = encoded_;
  checked(av_channel_layout_copy(&frame_->ch_layout, &encoder_->ch_layout), "audio");
  checked(av_frame_get_buffer(frame_.get(), 0), "audio");
  const auto end = waiting_.begin() + static_cast<std::ptrdiff_t>(samples);
  std::copy(waiting_.begin(), end, reinterpret_cast<float *>(frame_->data[0]));
  waiting_.erase(waiting_.begin(), end);
  encoded_ += static_cast<std::int64_t>(samples);
  checked(avcodec_send_frame(encoder_.get(), frame_.get()), "audio");
  take_packets();
}

void AacEncoder::take_packets() {
  while (avcodec_receive_packet(encoder_.get(), packet_.get()) >= 0) {
    sink_(*packet_);
    av_packet_unref(packet_.get());
  }
}

}  // namespace clips
