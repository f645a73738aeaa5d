// The sound of the four inputs, decoded.

#include <complex>
#include <numbers>

#include "picture/audio_encoder.h"
#include "picture_test.h"

using card::kAudioInputs, card::kSampleRate, card::tone_frequency;

namespace {

double strength(const std::vector<std::int16_t> &samples, unsigned frequency) {
  std::complex<double> sum;
  for (std::size_t i = 0; i < samples.size(); ++i)
    sum += static_cast<double>(samples[i]) *
           std::polar(1.0, 2 * std::numbers::pi * frequency * static_cast<double>(i) / kSampleRate);
  return std::abs(sum) / static_cast<double>(samples.size());
}

// Catches: blocks of another size or packing, inputs mixed up, an encoder that starts afresh at every block.
TEST_F(PictureTest, EveryAudioInputDecodesToItsOwnToneOrToSilence) {
  constexpr unsigned kSilent = 2;
  state.sound_present = 0xF & ~(1u << kSilent);
  std::array<std::vector<u8>, kAudioInputs> streams;
  for (int block = 0; block < 125; ++block) {
    engine.audio_block(state, block);
    const auto ready = audio.pop(std::chrono::microseconds{0});
    ASSERT_TRUE(ready && ready->area.size() == kAudioInputs * driver::kAudioBlockSize && ready->result > 0);
    for (std::size_t i = 0; i < ready->area.size(); ++i)
      streams[i / driver::kAudioBlockSize].push_back(ready->area[i]);
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
