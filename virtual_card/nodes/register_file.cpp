// Registers of the chips and their power-up values.
#include "register_file.h"

namespace virtual_card {

RegisterFile codec_at_power_up() {
  RegisterFile chip;
  chip.write(driver::kRegDisplayState, driver::kDisplayStateBit);
  chip.write(driver::kRegMjpegQuality, CardState{}.mjpeg_quality);
  return chip;
}

RegisterFile video_input_at_power_up() {
  // Bits 0-27 hold other settings, which a write of the channel must keep.
  constexpr u32 kWindowSetup = 0x00000100;
  RegisterFile block;
  for (u32 window = 0; window < kChannels; ++window)
    block.write(driver::kRegRouting + 4 * window, window << driver::kRoutingShift | kWindowSetup);
  return block;
}

DecoderChips::DecoderChips() {
  constexpr u8 kNeutral = 128;
  for (auto &chip : bytes_)
    for (unsigned channel = 0; channel < driver::kChannelsPerChip; ++channel)
      for (unsigned property = 0; property < 4; ++property)
        chip[driver::kDecoderProperty + driver::kDecoderChannelStride * channel + property] = kNeutral;
}

u8 DecoderChips::read(unsigned chip, unsigned address, const CardState &state) const {
  if (address != driver::kDecoderStatus || status_written_.at(chip)) return bytes_.at(chip).at(address);
  u32 status = chip == 0 ? state.sound_present << 4 : 0;  // chip 0 also reports the audio inputs
  for (unsigned n = 0; n < driver::kChannelsPerChip; ++n)
    if (!state.channel[chip * driver::kChannelsPerChip + n].lost) status |= 1u << n;
  return static_cast<u8>(status);
}

void DecoderChips::write(unsigned chip, unsigned address, u8 value) {
  bytes_.at(chip).at(address) = value;
  if (address == driver::kDecoderStatus) status_written_.at(chip) = true;
}

std::optional<u8> DecoderChips::written(unsigned chip, unsigned address) const {
  if (address == driver::kDecoderStatus && !status_written_.at(chip)) return {};
  return bytes_.at(chip).at(address);
}

PictureSettings DecoderChips::picture(unsigned channel) const {
  const auto &chip = bytes_.at(channel / driver::kChannelsPerChip);
  const unsigned first =
      driver::kDecoderProperty + driver::kDecoderChannelStride * (channel % driver::kChannelsPerChip);
  return {chip[first], chip[first + 1], chip[first + 2], chip[first + 3]};
}

}  // namespace virtual_card
