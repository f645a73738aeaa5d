/**
 * @file preview_mode.cpp
 * Preview layout, focus channel and channel numbers.
 */
#include <utility>

#include "command.h"
#include "internal.h"
#include "zv_bits.h"
#include "zv_card.h"
#include "zv_display.h"
#include "zv_lib.h"

namespace zarvo {

int set_preview_mode(ZV_CARD &card, u32 mode) {
  if (mode > MUX_MODE_ZV_16CH) return ZV_ERR_MODE;
  card.display.mode = mode;
  zv_display_mux_mode(&card.display, mode, card.resolution);
  return ZV_OK;
}

namespace {

u32 preview_mode_of(ZV_CARD &card) {
  return card.display.mode;
}

constexpr u32 kChannelMask = 0xFu << driver::kRoutingShift;

constexpr u32 routing_register(u32 position) {
  return driver::kRegRouting + 4 * position;
}

constexpr u32 routed_channel(u32 routing) {
  return routing >> driver::kRoutingShift;
}

u32 with_channel(u32 routing, u32 channel) {
  return restore_bit(routing, kChannelMask, channel << driver::kRoutingShift);
}

u32 focus_channel(ZV_CARD &card) {
  return routed_channel(read_video_input(card, routing_register(0)));
}

/// The display position 1-15 that carries a channel; ZV_CHANNELS when none does.
u32 position_of(const ZV_CARD &card, u32 channel) {
  u32 position = 1;
  while (position < ZV_CHANNELS &&
         routed_channel(read_video_input(card, routing_register(position))) != channel)
    ++position;
  return position;
}

int set_focus_channel(ZV_CARD &card, u32 channel) {
  if (channel >= ZV_CHANNELS) return ZV_ERR_CHANNEL;
  const u32 first = read_video_input(card, routing_register(0));
  const u32 current = routed_channel(first);
  if (current == channel) return ZV_OK;
  const u32 position = position_of(card, channel);
  if (position == ZV_CHANNELS) return ZV_ERR_CHANNEL;
  write_video_input(card, routing_register(0), with_channel(first, channel));
  const u32 other = read_video_input(card, routing_register(position));
  write_video_input(card, routing_register(position), with_channel(other, current));
  card.display.window[position].channel = std::exchange(card.display.window[0].channel, channel);
  return ZV_OK;
}

int send_channel_number(ZV_CARD &card, u32 channel, u32 code) {
  if (channel >= ZV_CHANNELS) return ZV_ERR_CHANNEL;
  issue(card.enc_fd, code, channel);
  return ZV_OK;
}

}  // namespace

}  // namespace zarvo

using namespace zarvo;

u32 zv_GetPreviewMode(HANDLE handle) {
  return value_from(handle, 0, preview_mode_of);
}

int zv_SetPreviewMode(HANDLE handle, u32 mode) {
  return status_from(handle, set_preview_mode, mode);
}

u32 zv_GetFocusChannel(HANDLE handle) {
  return value_from(handle, 0, focus_channel);
}

int zv_SetFocusChannel(HANDLE handle, u32 channel) {
  return status_from(handle, set_focus_channel, channel);
}

int zv_EnableVideoChannelNumber(HANDLE handle, u32 channel) {
  return status_from(handle, send_channel_number, channel, driver::ENC_IOC_CHANNEL_NUMBER_ON);
}

int zv_DisableVideoChannelNumber(HANDLE handle, u32 channel) {
  return status_from(handle, send_channel_number, channel, driver::ENC_IOC_CHANNEL_NUMBER_OFF);
}
