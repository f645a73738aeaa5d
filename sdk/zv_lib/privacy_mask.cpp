/**
 * @file privacy_mask.cpp
 * Sets and reads the privacy mask of a channel.
 */
#include "command.h"
#include "internal.h"
#include "zv_card.h"
#include "zv_picture.h"

namespace zarvo {

namespace {

int set_shield(ZV_CARD &card, u32 channel, const ZV_RECT *rect) {
  if (channel >= ZV_CHANNELS) return ZV_ERR_CHANNEL;
  if (rect == nullptr || !fits_input(card, *rect)) return ZV_ERR_PARAM;
  card.shield[channel] = *rect;
  issue(card.vin_fd, driver::VIN_IOC_SET_MASK,
        driver::Mask{channel, rect->x_start, rect->x_end, rect->y_start, rect->y_end});
  return ZV_OK;
}

int get_shield(ZV_CARD &card, u32 channel, ZV_RECT *rect) {
  if (channel >= ZV_CHANNELS) return ZV_ERR_CHANNEL;
  if (rect == nullptr) return ZV_ERR_PARAM;
  const driver::Mask mask =
      driver::unpacked_mask(channel, read_video_input(card, driver::kRegPrivacyMask + 4 * channel));
  rect->x_start = mask.x_start;
  rect->x_end = mask.x_end;
  rect->y_start = mask.y_start;
  rect->y_end = mask.y_end;
  return ZV_OK;
}

}  // namespace

}  // namespace zarvo

using namespace zarvo;

int zv_SetShieldRect(HANDLE handle, u32 channel, const ZV_RECT *rect) {
  return status_from(handle, set_shield, channel, rect);
}

int zv_GetShieldRect(HANDLE handle, u32 channel, ZV_RECT *rect) {
  return status_from(handle, get_shield, channel, rect);
}
