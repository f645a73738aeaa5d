/**
 * @file status.cpp
 * What the inputs and the board report.
 */
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

constexpr u32 kUnknownVersion = 3;

u32 hardware_version(ZV_CARD &card) {
  struct Version {
    u32 reply;
    u32 version;
  };
  constexpr Version kVersions[] = {{0x00, 0}, {0xBB, 0}, {0xCC, 1}, {0xDD, 2}};
  const u32 reply = board_command(card, driver::kBoardVersion, 0xFF);
  for (const Version &entry : kVersions)
    if (entry.reply == reply) return entry.version;
  return kUnknownVersion;
}

}  // namespace

u32 video_loss(ZV_CARD &card) {
  u32 present = 0;
  for (u8 chip = 0; chip < driver::kDecoderChips; ++chip)
    present |= (read_decoder(card, chip, driver::kDecoderStatus) & 0xFu) << driver::kChannelsPerChip * chip;
  return ~present & kAllVideo;
}

}  // namespace zarvo

using namespace zarvo;

u32 zv_GetVideoStatus(HANDLE handle) {
  return value_from(handle, kAllVideo, video_loss);
}

u32 zv_GetAudioStatus(HANDLE handle) {
  return value_from(handle, kAllAudio, audio_loss);
}

u32 zv_GetHardwareVersion(HANDLE handle) {
  return value_from(handle, kUnknownVersion, hardware_version);
}
