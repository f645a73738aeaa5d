// Encodes MPEG-4 frames with libavcodec.
#include "mpeg4_encoder.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cmath>

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavutil/opt.h>
}

namespace virtual_card {

namespace {

constexpr u32 kMinQuantiser = 1;
constexpr u32 kMaxQuantiser = 31;
constexpr u32 kMaxGop = 600;
constexpr u32 kMinBitRate = 16000;
constexpr u32 kMaxBitRate = 50000000;

/// The time base in the host's header, also for PAL. Timestamps count encoded pictures.
constexpr AVRational kTimeBase{1001, 30000};

struct Option {
  const char *name;
  std::int64_t value;
};
constexpr std::array<Option, 3> kOptions{{
    {"mpeg_quant", 1},             // as in the host's header
    {"motion_est", 1},             // EPZS, the cheapest search that still follows motion
    {"sc_threshold", 1000000000},  // intra frames only by GOP, not at scene cuts
}};

AVCodecContext *open_encoder(const Mpeg4Settings &settings) {
  const AVCodec *codec = avcodec_find_encoder(AV_CODEC_ID_MPEG4);
  AVCodecContext *encoder = codec != nullptr ? avcodec_alloc_context3(codec) : nullptr;
  if (encoder == nullptr) return nullptr;
  encoder->width = static_cast<int>(settings.size.width);
  encoder->height = static_cast<int>(settings.size.height);
  encoder->pix_fmt = AV_PIX_FMT_YUV420P;
  encoder->time_base = kTimeBase;
  encoder->gop_size = static_cast<int>(settings.gop);
  encoder->max_b_frames = 0;
  encoder->thread_count = 1;
  encoder->qmin = static_cast<int>(settings.min_quantiser);
  encoder->qmax = static_cast<int>(settings.max_quantiser);
  encoder->flags |= AV_CODEC_FLAG_GLOBAL_HEADER | AV_CODEC_FLAG_BITEXACT;
  if (settings.size.interlaced) encoder->flags |= AV_CODEC_FLAG_INTERLACED_DCT;
  if (settings.bit_rate == 0) {
    encoder->flags |= AV_CODEC_FLAG_QSCALE;
    encoder->global_quality = static_cast<int>(settings.quantiser) * FF_QP2LAMBDA;
  } else {
    // The encoder calculates with 30000/1001 pictures a second.
    const double bits = settings.bit_rate / (settings.rate * av_q2d(kTimeBase));
    encoder->bit_rate = std::llround(bits);
    encoder->bit_rate_tolerance = static_cast<int>(bits);
  }
  for (const Option &option : kOptions) {
    av_opt_set_int(encoder, option.name, option.value, AV_OPT_SEARCH_CHILDREN);
  }
  if (avcodec_open2(encoder, codec, nullptr) < 0) avcodec_free_context(&encoder);
  return encoder;
}

std::int64_t whole_seconds(std::int64_t picture) {
  return picture * kTimeBase.num / kTimeBase.den;
}

/// Marks the frame as two fields, the upper one first. Later versions of the library have flags for it.
void mark_interlaced(AVFrame &frame) {
#ifdef AV_FRAME_FLAG_INTERLACED
  frame.flags |= AV_FRAME_FLAG_INTERLACED | AV_FRAME_FLAG_TOP_FIELD_FIRST;
#else
  frame.interlaced_frame = frame.top_field_first = 1;
#endif
}

constexpr std::array<u8, 4> kPictureStart{0, 0, 1, 0xB6};
/// Offset in bits of modulo_time_base, behind start code and picture type: one 1 bit for each second begun.
constexpr std::size_t kSecondsBit = 34;

/// Inserts a 1 bit into modulo_time_base in the header of a picture: a second has begun. The bits behind it
/// move on by one, and the stuffing at the end is written again: a 0 bit, then 1 bits to the end of the byte.
void begin_second(std::vector<u8> &bits) {
  const std::size_t stuffing = static_cast<std::size_t>(std::countr_one(bits.back())) + 1;
  const std::size_t used = bits.size() * 8 - stuffing;
  bits.push_back(0);
  for (std::size_t i = bits.size() - 1; i > kSecondsBit / 8; --i) {
    bits[i] = static_cast<u8>(bits[i - 1] << 7 | bits[i] >> 1);
  }
  constexpr u8 behind = 0xFF >> kSecondsBit % 8;
  u8 &byte = bits[kSecondsBit / 8];
  byte = static_cast<u8>((byte & ~behind) | (byte & behind) >> 1 | (behind + 1) >> 1);
  bits.resize((used + 1) / 8 + 1);
  const unsigned last = (used + 1) % 8;  // bits of the picture in the last byte
  bits.back() = static_cast<u8>((bits.back() & ~(0xFF >> last)) | 0x7F >> last);
}

}  // namespace

Mpeg4Settings mpeg4_settings(const EncoderSettings &encoder, EncodedSize size, double rate) {
  Mpeg4Settings settings;
  settings.size = size;
  settings.gop = std::clamp(encoder.gop, 1u, kMaxGop);
  if (encoder.qp_range.enable != 0) {
    settings.min_quantiser = std::clamp(encoder.qp_range.min, kMinQuantiser, kMaxQuantiser);
    settings.max_quantiser = std::clamp(encoder.qp_range.max, settings.min_quantiser, kMaxQuantiser);
  }
  settings.quantiser = std::clamp(encoder.qp, settings.min_quantiser, settings.max_quantiser);
  if (encoder.cbr.enable != 0) {
    settings.bit_rate = std::clamp(encoder.cbr.value, kMinBitRate, kMaxBitRate);
    settings.rate = rate;
  }
  return settings;
}

Mpeg4Encoder::Mpeg4Encoder(const Mpeg4Settings &settings)
    : settings_(settings),
      encoder_(open_encoder(settings)),
      frame_(av_frame_alloc()),
      packet_(av_packet_alloc()) {}

Mpeg4Frame Mpeg4Encoder::encode(const EncodedPicture &picture) {
  Mpeg4Frame result;
  if (!encoder_ || !frame_ || !packet_) return result;
  AVFrame &frame = *frame_;
  frame.format = AV_PIX_FMT_YUV420P;
  frame.width = encoder_->width;
  frame.height = encoder_->height;
  frame.pts = count_;
  if (settings_.size.interlaced) mark_interlaced(frame);
  frame.quality = encoder_->global_quality;
  const std::array<const u8 *, 3> planes{picture.y.data(), picture.cb.data(), picture.cr.data()};
  for (std::size_t i = 0; i < planes.size(); ++i) {
    frame.data[i] = const_cast<u8 *>(planes[i]);  // the encoder only reads it
    frame.linesize[i] = i == 0 ? frame.width : frame.width / 2;
  }
  if (avcodec_send_frame(encoder_.get(), &frame) < 0) return result;
  if (avcodec_receive_packet(encoder_.get(), packet_.get()) < 0) return result;
  result.intra = (packet_->flags & AV_PKT_FLAG_KEY) != 0;
  const u8 *const end = packet_->data + packet_->size;
  const u8 *const begin = packet_->data;
  result.bitstream.assign(std::search(begin, end, kPictureStart.begin(), kPictureStart.end()), end);
  av_packet_unref(packet_.get());
  // The encoder puts the time of an intra frame into a header in front of the picture, which was removed
  // above.
  const bool second_begun = count_ > 0 && whole_seconds(count_) != whole_seconds(count_ - 1);
  if (result.intra && second_begun && !result.bitstream.empty()) begin_second(result.bitstream);
  ++count_;
  return result;
}

}  // namespace virtual_card
