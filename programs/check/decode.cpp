// Decodes with libavcodec.
#include "decode.h"

#include <cstring>
#include <stdexcept>

#include "programs/common/libav.h"

namespace contract {
namespace {

class Decoder {
 public:
  explicit Decoder(AVCodecID id)
      : frame_(libav::allocated(av_frame_alloc())), packet_(libav::allocated(av_packet_alloc())) {
    av_log_set_level(AV_LOG_QUIET);
    const AVCodec *const codec = avcodec_find_decoder(id);
    if (codec == nullptr) throw std::runtime_error("libavcodec has no decoder");
    codec_.reset(libav::allocated(avcodec_alloc_context3(codec)));
    codec_->thread_count = 1;
    codec_->err_recognition = AV_EF_BITSTREAM | AV_EF_BUFFER | AV_EF_EXPLODE;
    if (id == AV_CODEC_ID_ADPCM_G726) {
      codec_->sample_rate = 8000;
      codec_->bits_per_coded_sample = 3;
      codec_->ch_layout = AV_CHANNEL_LAYOUT_MONO;
    }
    libav::checked(avcodec_open2(codec_.get(), codec, nullptr), "libavcodec opens no decoder");
  }

  /// Decodes data, or without data what the decoder still has. Calls `take` for each frame. Returns false on
  /// an error in the data.
  template <typename Take>
  bool decode(const std::vector<u8> &data, Take take) {
    bool good = true;
    if (data.empty())
      avcodec_send_packet(codec_.get(), nullptr);
    else
      good = libav::send(*codec_, *packet_, data) >= 0;
    int result = 0;
    while ((result = avcodec_receive_frame(codec_.get(), frame_.get())) >= 0) {
      if (frame_->decode_error_flags != 0) good = false;
      take(*frame_);
    }
    return good && (result == AVERROR(EAGAIN) || result == AVERROR_EOF);
  }

 private:
  libav::CodecContext codec_;
  libav::FrameOwner frame_;
  libav::PacketOwner packet_;
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
    decoded_.interlaced = libav::is_interlaced(frame);
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

Decoded decode_mjpeg(const Track &track) {
  Decoded decoded;
  Decoder decoder(AV_CODEC_ID_MJPEG);
  Taker take(decoded);
  for (const Frame &frame : track)
    if (!decoder.decode(frame.data, take)) ++decoded.errors;
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
