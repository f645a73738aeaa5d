// Decodes with libavcodec.
#include "decode.h"

#include <cstring>
#include <memory>
#include <stdexcept>

extern "C" {
#include <libavcodec/avcodec.h>
}

namespace contract {
namespace {

class Decoder {
 public:
  explicit Decoder(AVCodecID id) {
    av_log_set_level(AV_LOG_QUIET);
    const AVCodec *const codec = avcodec_find_decoder(id);
    codec_ = codec != nullptr ? avcodec_alloc_context3(codec) : nullptr;
    frame_ = av_frame_alloc();
    packet_ = av_packet_alloc();
    if (codec_ == nullptr || frame_ == nullptr || packet_ == nullptr)
      throw std::runtime_error("libavcodec has no decoder, or memory is short");
    codec_->thread_count = 1;
    codec_->err_recognition = AV_EF_BITSTREAM | AV_EF_BUFFER | AV_EF_EXPLODE;
    if (id == AV_CODEC_ID_ADPCM_G726) {
      codec_->sample_rate = 8000;
      codec_->bits_per_coded_sample = 3;
      codec_->ch_layout = AV_CHANNEL_LAYOUT_MONO;
    }
    if (avcodec_open2(codec_, codec, nullptr) < 0) throw std::runtime_error("libavcodec opens no decoder");
  }
  ~Decoder() {
    avcodec_free_context(&codec_);
    av_frame_free(&frame_);
    av_packet_free(&packet_);
  }
  Decoder(const Decoder &) = delete;
  Decoder &operator=(const Decoder &) = delete;

  /// Decodes data, or without data what the decoder still has. Calls `take` for each frame. Returns false on
  /// an error in the data.
  template <typename Take>
  bool decode(const std::vector<u8> &data, Take take) {
    bool good = true;
    if (data.empty()) {
      avcodec_send_packet(codec_, nullptr);
    } else {
      if (av_new_packet(packet_, static_cast<int>(data.size())) < 0) throw std::bad_alloc();
      std::memcpy(packet_->data, data.data(), data.size());
      good = avcodec_send_packet(codec_, packet_) >= 0;
      av_packet_unref(packet_);
    }
    int result = 0;
    while ((result = avcodec_receive_frame(codec_, frame_)) >= 0) {
      if (frame_->decode_error_flags != 0) good = false;
      take(*frame_);
    }
    return good && (result == AVERROR(EAGAIN) || result == AVERROR_EOF);
  }

 private:
  AVCodecContext *codec_ = nullptr;
  AVFrame *frame_ = nullptr;
  AVPacket *packet_ = nullptr;
};

std::vector<u8> plane_of(const AVFrame &frame, int plane, u32 width, u32 height) {
  std::vector<u8> bytes(std::size_t{width} * height);
  for (u32 y = 0; y < height; ++y)
    std::memcpy(bytes.data() + std::size_t{y} * width,
                frame.data[plane] + static_cast<std::ptrdiff_t>(y) * frame.linesize[plane], width);
  return bytes;
}

/// Copies a 4:2:0 picture; empty for another format.
Image image_of(const AVFrame &frame) {
  if (frame.format != AV_PIX_FMT_YUV420P && frame.format != AV_PIX_FMT_YUVJ420P) return {};
  const auto width = static_cast<u32>(frame.width), height = static_cast<u32>(frame.height);
  return {width,
          height,
          height / 2,
          plane_of(frame, 0, width, height),
          plane_of(frame, 1, width / 2, height / 2),
          plane_of(frame, 2, width / 2, height / 2)};
}

/// Takes pictures of a decoder in.
class Taker {
 public:
  explicit Taker(Decoded &decoded) : decoded_(decoded) {}
  void operator()(const AVFrame &frame) {
    const auto width = static_cast<u32>(frame.width), height = static_cast<u32>(frame.height);
    if (decoded_.pictures > 0 && (width != decoded_.width || height != decoded_.height))
      decoded_.one_size = false;
    decoded_.width = width;
    decoded_.height = height;
    decoded_.interlaced = frame.interlaced_frame != 0;
    ++decoded_.pictures;
    decoded_.last = image_of(frame);
  }

 private:
  Decoded &decoded_;
};

}  // namespace

Decoded decode_mpeg4(const Track &track) {
  Decoded decoded;
  Decoder decoder(AV_CODEC_ID_MPEG4);
  Taker take(decoded);
  for (const Frame &frame : track)
    if (!decoder.decode(frame.data, take)) ++decoded.errors;
  if (!track.empty() && !decoder.decode({}, take)) ++decoded.errors;
  return decoded;
}

Decoded decode_mjpeg(const Track &track, std::size_t every) {
  Decoded decoded;
  Decoder decoder(AV_CODEC_ID_MJPEG);
  Taker take(decoded);
  for (std::size_t n = 0; n < track.size(); n += every)
    if (!decoder.decode(track[n].data, take)) ++decoded.errors;
  return decoded;
}

Image decode_jpeg(const Frame &frame) {
  const Decoded decoded = decode_mjpeg({frame});
  return decoded.errors == 0 ? decoded.last : Image{};
}

std::vector<std::int16_t> decode_audio(const Track &track) {
  std::vector<std::int16_t> samples;
  Decoder decoder(AV_CODEC_ID_ADPCM_G726);
  for (const Frame &frame : track)
    decoder.decode(frame.data, [&](const AVFrame &sound) {
      const auto *first = reinterpret_cast<const std::int16_t *>(sound.data[0]);
      samples.insert(samples.end(), first, first + sound.nb_samples);
    });
  return samples;
}

}  // namespace contract
