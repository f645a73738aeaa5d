/**
 * @file status.cpp
 * Video loss, audio loss and the board version.
 */
#include <algorithm>
#include <iterator>

#include "command.h"
#include "internal.h"
#include "zv_card.h"
#include "zv_lib.h"

namespace zarvo {

namespace {

constexpr u32 kAllAudio = 0xF;

u32 audio_loss(ZV_CARD &card) {
  return ~(u32{read_decoder(card, 0, driver::kDecoderStatus)} >> 4) & kAllAudio;
}

constexpr u32 kUnknownVersion = std::size(driver::kBoardVersionReplies);

u32 hardware_version(ZV_CARD &card) {
  const u32 reply = board_command(card, driver::kBoardVersion, 0xFF);
  if (reply == 0) return 0;
  const auto known =
      std::find(std::begin(driver::kBoardVersionReplies), std::end(driver::kBoardVersionReplies), reply);
  return static_cast<u32>(known - std::begin(driver::kBoardVersionReplies));
}

}  // namespace

u32 video_loss(ZV_CARD &card) {
  u32 present = 0;
  for (u8 chip = 0; chip < driver::kDecoderChips; ++chip)
    present |= (read_decoder(card, chip, driver::kDecoderStatus) & 0xFu) << driver::kChannelsPerChip * chip;
  return ~present & kAllChannels;
}

}  // namespace zarvo

using namespace zarvo;

u32 zv_GetVideoStatus(HANDLE handle) {
  return value_from(handle, kAllChannels, video_loss);
}

u32 zv_GetAudioStatus(HANDLE handle) {
  return value_from(handle, kAllAudio, audio_loss);
}

u32 zv_GetHardwareVersion(HANDLE handle) {
  return value_from(handle, kUnknownVersion, hardware_version);
}
