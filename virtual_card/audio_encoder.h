/**
 * @file audio_encoder.h
 * The sound at an audio input and its encoder: 8 kHz mono, G.726 at 24 kbit/s.
 */
#ifndef VIRTUAL_CARD_AUDIO_ENCODER_H
#define VIRTUAL_CARD_AUDIO_ENCODER_H

#include <array>
#include <cstdint>
#include <memory>
#include <vector>

#include "card_state.h"

struct AVCodecContext;
struct AVFrame;
struct AVPacket;

namespace virtual_card {

inline constexpr unsigned kSampleRate = 8000;
inline constexpr unsigned kBlockSamples = 128;

/// The tone of an input, in Hz.
unsigned tone_frequency(unsigned input);

class AudioEncoder {
 public:
  explicit AudioEncoder(unsigned input) : input_(input) {}
  ~AudioEncoder();

  /// Encodes block number `block` of the input's test sound, a beep a second, or of silence.
  std::array<u8, driver::kAudioBlockSize> encode(std::int64_t block, bool sound);

 private:
  bool start();

  struct Closer {
    void operator()(AVCodecContext *encoder) const;
    void operator()(AVFrame *frame) const;
    void operator()(AVPacket *packet) const;
  };
  unsigned input_;
  std::vector<std::int16_t> second_;  ///< the sound repeats every second
  std::unique_ptr<AVCodecContext, Closer> encoder_;
  std::unique_ptr<AVFrame, Closer> frame_;
  std::unique_ptr<AVPacket, Closer> packet_;
};

}  // namespace virtual_card

#endif
