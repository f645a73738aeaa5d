/**
 * @file register_file.h
 * Registers of the chips on the card: 32-bit words at any address, and the decoders' 8-bit registers.
 */
#ifndef VIRTUAL_CARD_REGISTER_FILE_H
#define VIRTUAL_CARD_REGISTER_FILE_H

#include <map>
#include <optional>

#include "card_state.h"

namespace virtual_card {

/// Registers of 32 bits. A register that was never written holds 0.
class RegisterFile {
 public:
  u32 read(u32 address) const {
    const auto found = words_.find(address);
    return found == words_.end() ? 0 : found->second;
  }
  void write(u32 address, u32 value) { words_[address] = value; }
  const std::map<u32, u32> &words() const { return words_; }

 private:
  std::map<u32, u32> words_;
};

/// Returns the codec chip after power-up: the display is running.
RegisterFile codec_at_power_up();
/// Returns the video-input block after power-up: window n shows channel n.
RegisterFile video_input_at_power_up();

/// The four TW2815 decoders.
class DecoderChips {
 public:
  static constexpr unsigned kRegisters = 256;  ///< of each decoder
  DecoderChips();
  /// Reads a register. The status register reports the cameras and audio inputs until it is written; then it
  /// keeps the value written.
  u8 read(unsigned chip, unsigned address, const CardState &state) const;
  void write(unsigned chip, unsigned address, u8 value);
  /// Returns the value in a register; none for a status register that was never written.
  std::optional<u8> written(unsigned chip, unsigned address) const;
  /// Returns the picture properties in the registers of a channel.
  PictureSettings picture(unsigned channel) const;

 private:
  std::array<std::array<u8, kRegisters>, driver::kDecoderChips> bytes_{};
  std::array<bool, driver::kDecoderChips> status_written_{};
};

}  // namespace virtual_card

#endif
