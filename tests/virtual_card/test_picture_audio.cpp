// The sound of the four inputs, decoded.

#include <numbers>

#include "picture/audio_encoder.h"
#include "picture_test.h"

using card::kAudioInputs, card::kSampleRate, card::tone_frequency;

namespace {

/// Strength of one frequency in the samples.
double strength(const std::vector<std::int16_t> &samples, unsigned frequency) {
  double real = 0, imaginary = 0;
  for (std::size_t i = 0; i < samples.size(); ++i) {
    const double turn = 2 * std::numbers::pi * frequency * static_cast<double>(i) / kSampleRate;
    real += samples[i] * std::cos(turn);
    imaginary += samples[i] * std::sin(turn);
  }
  return std::hypot(real, imaginary) / static_cast<double>(samples.size());
}

// Blocks of another size or packing, inputs mixed up, an encoder that starts afresh at every block.
TEST_F(PictureTest, EveryAudioInputDecodesToItsOwnToneOrToSilence) {
  constexpr unsigned kSilent = 2;
  state.sound_present = 0xF & ~(1u << kSilent);
  std::array<std::vector<u8>, kAudioInputs> streams;
  for (int block = 0; block < 125; ++block) {
    engine.audio_block(state, block);
    const auto ready = audio.pop(std::chrono::microseconds{0});
    ASSERT_TRUE(ready);
    ASSERT_EQ(ready->area.size(), kAudioInputs * driver::kAudioBlockSize);
    EXPECT_GT(ready->result, 0);
    for (std::size_t i = 0; i < kAudioInputs; ++i) {
      const auto *begin = ready->area.data() + i * driver::kAudioBlockSize;
      streams[i].insert(streams[i].end(), begin, begin + driver::kAudioBlockSize);
    }
  }
  for (unsigned input = 0; input < kAudioInputs; ++input) {
    const auto samples = decode_g726(streams[input]);
    ASSERT_EQ(samples.size(), 2u * kSampleRate);
    for (unsigned other = 0; other < kAudioInputs; ++other) {
      const bool own = input == other && input != kSilent;
      const double level = strength(samples, tone_frequency(other));
      EXPECT_TRUE(own ? level > 1500 : level < 150)
          << "input " << input << ", tone of " << other << ": " << level;
    }
  }
}

}  // namespace
