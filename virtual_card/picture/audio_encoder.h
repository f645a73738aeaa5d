/**
 * @file audio_encoder.h
 * The test sound of an audio input and its encoder: 8 kHz mono, G.726 at 24 kbit/s.
 */
#ifndef VIRTUAL_CARD_AUDIO_ENCODER_H
#define VIRTUAL_CARD_AUDIO_ENCODER_H

#include <array>
#include <cstdint>
#include <vector>

#include "av_ptr.h"
#include "card_state.h"

namespace virtual_card {

inline constexpr unsigned kSampleRate = 8000;
inline constexpr unsigned kBlockSamples = 128;

/// Returns the frequency of an input's test sound, in Hz.
unsigned tone_frequency(unsigned input);

class AudioEncoder {
 public:
  explicit AudioEncoder(unsigned input) : input_(input) {}

  /// Encodes block number `block`: of the input's test sound, one beep a second, or of silence.
  std::array<u8, driver::kAudioBlockSize> encode(std::int64_t block, bool sound);

 private:
  bool start();

  unsigned input_;
  std::vector<std::int16_t> second_;  ///< one second of the test sound, which repeats
  AvPtr<AVCodecContext> encoder_;
  AvPtr<AVFrame> frame_;
  AvPtr<AVPacket> packet_;
};

}  // namespace virtual_card

#endif
