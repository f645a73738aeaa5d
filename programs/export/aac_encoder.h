/**
 * @file aac_encoder.h
 * Turns the audio of recordings, G.726, into AAC: mp4 has no place for G.726.
 */
#ifndef EXPORT_AAC_ENCODER_H
#define EXPORT_AAC_ENCODER_H

#include <cstdint>
#include <functional>
#include <span>
#include <vector>

#include "programs/common/libav.h"

namespace clips {

inline constexpr int kSampleRate = 8000;
inline constexpr std::size_t kBlockBytes = 48;
inline constexpr std::int64_t kBlockSamples = 128;
inline constexpr int kSampleBits = 3;

class AacEncoder {
 public:
  /// Each packet goes to `sink`, with times in samples. Throws std::runtime_error if libavcodec has no AAC
  /// encoder.
  using Sink = std::function<void(AVPacket &packet)>;
  explicit AacEncoder(Sink sink);

  const AVCodecContext &context() const { return *encoder_; }

  /// Adds a block of 128 samples that begins at a sample number; silence fills what is missing in front of
  /// it.
  void add(std::span<const std::uint8_t> block, std::int64_t sample);
  void finish();

 private:
  void encode_whole_frames();
  void encode(std::size_t samples);
  void take_packets();

  Sink sink_;
  libav::CodecContext decoder_, encoder_;
  libav::FrameOwner decoded_, frame_;
  libav::PacketOwner packet_;
  std::vector<float> waiting_;  ///< samples that fill no frame yet
  std::int64_t encoded_ = 0;    ///< samples given to the encoder
};

}  // namespace clips

#endif
