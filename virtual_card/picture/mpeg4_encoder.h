/**
 * @file mpeg4_encoder.h
 * The MPEG-4 encoder of one channel. Its frames have no stream header: a decoder needs the header that the
 * host puts in front of an intra frame.
 */
#ifndef VIRTUAL_CARD_MPEG4_ENCODER_H
#define VIRTUAL_CARD_MPEG4_ENCODER_H

#include <cstdint>
#include <vector>

#include "av_ptr.h"
#include "encoded_picture.h"

namespace virtual_card {

struct Mpeg4Settings {
  EncodedSize size{};
  u32 gop = 1;        ///< frames from one intra frame to the next
  u32 quantiser = 1;  ///< 1 to 31; used when bit_rate is 0
  u32 bit_rate = 0;   ///< bits a second; 0: fixed quantiser
  u32 min_quantiser = 1;
  u32 max_quantiser = 31;
  double rate = 30;  ///< pictures a second

  bool operator==(const Mpeg4Settings &) const = default;
};

/// Converts the settings of a channel; clamps values that the encoder cannot take.
Mpeg4Settings mpeg4_settings(const EncoderSettings &encoder, EncodedSize size, double rate);

struct Mpeg4Frame {
  bool intra = false;
  std::vector<u8> bitstream;  ///< begins with the start code of the picture; empty when encoding failed
};

class Mpeg4Encoder {
 public:
  explicit Mpeg4Encoder(const Mpeg4Settings &settings);

  const Mpeg4Settings &settings() const { return settings_; }
  /// Encodes a picture. The first frame is an intra frame.
  Mpeg4Frame encode(const EncodedPicture &picture);

 private:
  Mpeg4Settings settings_;
  AvPtr<AVCodecContext> encoder_;
  AvPtr<AVFrame> frame_;
  AvPtr<AVPacket> packet_;
  std::int64_t count_ = 0;
};

}  // namespace virtual_card

#endif
