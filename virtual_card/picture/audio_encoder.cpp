// The test sound of an audio input and its G.726 encoder.
#include "audio_encoder.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <numbers>

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavutil/channel_layout.h>
}

namespace virtual_card {

namespace {

constexpr std::array<unsigned, kAudioInputs> kTones{300, 500, 800, 1200};
constexpr unsigned kBitRate = 24000;
constexpr double kLoudness = 9000;
constexpr unsigned kBeepSamples = kSampleRate * 7 / 10;
/// A beep fades in over this many samples, and out again, so that it does not click.
constexpr double kFadeSamples = kSampleRate / 50.0;

std::vector<std::int16_t> beep(unsigned frequency) {
  std::vector<std::int16_t> second(kSampleRate, 0);
  for (unsigned i = 0; i < kBeepSamples; ++i) {
    const double turn = 2.0 * std::numbers::pi * frequency * i / kSampleRate;
    const double fade = std::min({1.0, i / kFadeSamples, (kBeepSamples - i) / kFadeSamples});
    second[i] = static_cast<std::int16_t>(
        std::lround(kLoudness * fade * (std::sin(turn) + 0.15 * std::sin(2 * turn))));
  }
  return second;
}

AVCodecContext *open_encoder() {
  const AVCodec *codec = avcodec_find_encoder(AV_CODEC_ID_ADPCM_G726);
  AVCodecContext *encoder = codec != nullptr ? avcodec_alloc_context3(codec) : nullptr;
  if (encoder == nullptr) return nullptr;
  encoder->bit_rate = kBitRate;
  encoder->sample_rate = kSampleRate;
  encoder->sample_fmt = AV_SAMPLE_FMT_S16;
  encoder->ch_layout = AV_CHANNEL_LAYOUT_MONO;
  if (avcodec_open2(encoder, codec, nullptr) < 0) {
    avcodec_free_context(&encoder);
    return nullptr;
  }
  // The codec accepts any number of samples; its own frame size is meant for files.
  encoder->frame_size = kBlockSamples;
  return encoder;
}

}  // namespace

unsigned tone_frequency(unsigned input) {
  return kTones[input % kTones.size()];
}

/// Creates the sound and the encoder on first use: many programs record no audio.
bool AudioEncoder::start() {
  if (second_.empty()) second_ = beep(tone_frequency(input_));
  if (!encoder_) encoder_.reset(open_encoder());
  if (!frame_) frame_.reset(av_frame_alloc());
  if (!packet_) packet_.reset(av_packet_alloc());
  return encoder_ && frame_ && packet_;
}

std::array<u8, driver::kAudioBlockSize> AudioEncoder::encode(std::int64_t block, bool sound) {
  std::array<u8, driver::kAudioBlockSize> bytes{};
  if (!start()) return bytes;
  std::array<std::int16_t, kBlockSamples> samples{};
  if (sound) {
    auto at = static_cast<std::size_t>(block * kBlockSamples % kSampleRate);
    for (std::int16_t &sample : samples) {
      sample = second_[at];
      at = (at + 1) % kSampleRate;
    }
  }
  AVFrame &frame = *frame_;
  frame.format = AV_SAMPLE_FMT_S16;
  frame.nb_samples = kBlockSamples;
  frame.sample_rate = kSampleRate;
  frame.ch_layout = AV_CHANNEL_LAYOUT_MONO;
  frame.data[0] = reinterpret_cast<u8 *>(samples.data());
  frame.extended_data = frame.data;
  frame.linesize[0] = static_cast<int>(sizeof(samples));
  if (avcodec_send_frame(encoder_.get(), &frame) < 0) return bytes;
  if (avcodec_receive_packet(encoder_.get(), packet_.get()) < 0) return bytes;
  std::memcpy(bytes.data(), packet_->data,
              std::min<std::size_t>(bytes.size(), static_cast<std::size_t>(packet_->size)));
  av_packet_unref(packet_.get());
  return bytes;
}

}  // namespace virtual_card
