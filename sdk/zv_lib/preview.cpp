/**
 * @file preview.cpp
 * The preview: layout, windows, picture, focus channel; and the channel number in encoded pictures.
 */
#include <unistd.h>

#include <cstring>
#include <utility>

#include "command.h"
#include "internal.h"
#include "zv_bits.h"
#include "zv_card.h"
#include "zv_display.h"
#include "zv_picture.h"

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

int enable_preview_channels(ZV_CARD &card, u32 mask) {
  if (mask >> ZV_CHANNELS != 0) return ZV_ERR_CHANNEL;
  issue(card.disp_fd, mask != 0 ? driver::DISP_IOC_PREVIEW_ON : driver::DISP_IOC_PREVIEW_OFF);
  for (u32 n = 0; n < ZV_CHANNELS; ++n) {
    ZV_DISPLAY_WINDOW &window = card.display.window[n];
    window.flags = (mask >> n & 1) != 0 ? ZV_WINDOW_ENABLED : 0;
    issue(card.disp_fd, driver::DISP_IOC_SET_WINDOW, window);
  }
  return ZV_OK;
}

int preview_screen(ZV_CARD &card, u8 **picture) {
  if (picture == nullptr) return -1;
  // The read asks for a whole picture, but the driver writes only one word. The scratch buffer is large
  // enough for a whole picture, in case a driver writes more.
  u32 index = driver::kPreviewBuffers;
  pthread_mutex_lock(&mutex_preview);
  std::memcpy(preview_scratch, &index, sizeof index);
  const ssize_t result =
      uninterrupted([&] { return read(card.disp_fd, preview_scratch, driver::kPreviewBufferSize); });
  std::memcpy(&index, preview_scratch, sizeof index);
  pthread_mutex_unlock(&mutex_preview);
  const bool whole = result > 0 && static_cast<std::size_t>(result) <= driver::kPreviewBufferSize;
  if (whole && index < driver::kPreviewBuffers) *picture = preview_buf[index];
  return static_cast<int>(result);
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

/// Returns the display position 1-15 that shows a channel, or ZV_CHANNELS if there is none.
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

int zv_EnablePreviewChannels(HANDLE handle, u32 mask) {
  return status_from(handle, enable_preview_channels, mask);
}

int zv_GetPreviewScreen(HANDLE handle, u8 **picture) {
  return value_from(handle, -1, preview_screen, picture);
}
