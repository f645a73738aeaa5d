/**
 * @file register_file.h
 * Registers of the chips on the card: words at any address, and the decoders' banks of bytes.
 */
#ifndef VIRTUAL_CARD_REGISTER_FILE_H
#define VIRTUAL_CARD_REGISTER_FILE_H

#include <map>

#include "card_state.h"

namespace virtual_card {

/// Words of 32 bits; one that was never written holds 0.
class RegisterFile {
 public:
  u32 read(u32 address) const {
    const auto found = words_.find(address);
    return found == words_.end() ? 0 : found->second;
  }
  void write(u32 address, u32 value) { words_[address] = value; }

 private:
  std::map<u32, u32> words_;
};

/// The codec chip after power-up: the display runs.
RegisterFile codec_at_power_up();
/// The video-input block after power-up: window n shows channel n.
RegisterFile video_input_at_power_up();

/// The four TW2815 decoders, 256 registers each.
class DecoderChips {
 public:
  DecoderChips();
  /// The status register follows the cameras and audio inputs until something writes it.
  u8 read(unsigned chip, unsigned address, const CardState &state) const;
  void write(unsigned chip, unsigned address, u8 value);
  /// The picture properties of a channel as its decoder has them.
  PictureSettings picture(unsigned channel) const;

 private:
  std::array<std::array<u8, 256>, driver::kDecoderChips> bytes_{};
  std::array<bool, driver::kDecoderChips> status_written_{};
};

}  // namespace virtual_card

#endif
