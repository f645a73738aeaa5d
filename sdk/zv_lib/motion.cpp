/**
 * @file motion.cpp
 * Motion detection: thresholds, excluded areas, start and stop, and the motion bits.
 */
#include <algorithm>

#include "command.h"
#include "internal.h"
#include "zv_bits.h"
#include "zv_card.h"
#include "zv_picture.h"

namespace zarvo {

void write_motion_control(const ZV_CARD &card) {
  write_codec(card, driver::kRegMotionControl, driver::kMotionControlAll);
}

void disable_motion(const ZV_CARD &card) {
  const u32 enabled = read_codec(card, driver::kRegMotionEnable);
  write_codec(card, driver::kRegMotionEnable, mask_bit(enabled, driver::kMotionEnableMask));
}

namespace {

/// Sends the same threshold for all blocks of a rectangle of blocks.
int send_thresholds(ZV_CARD &card, driver::MotionMap area, u32 threshold) {
  if (card.motion_map == nullptr) return ZV_ERR_NO_MEMORY;
  std::fill_n(card.motion_map, area.columns * area.rows, static_cast<u16>(threshold));
  area.thresholds = card.motion_map;
  return issue(card.vin_fd, driver::VIN_IOC_SET_MOTION_MAP, area) != 0 ? ZV_ERR_DEVICE : ZV_OK;
}

int get_sensitivity(ZV_CARD &card, u32 channel, u32 *sensitivity) {
  if (channel >= ZV_CHANNELS) return ZV_ERR_CHANNEL;
  if (sensitivity == nullptr) return ZV_ERR_PARAM;
  *sensitivity = card.motion_sensitivity[channel];
  return ZV_OK;
}

int set_sensitivity(ZV_CARD &card, u32 channel, u32 sensitivity) {
  if (channel >= ZV_CHANNELS) return ZV_ERR_CHANNEL;
  if (sensitivity > driver::kNeverMoves) return ZV_ERR_PARAM;
  card.motion_sensitivity[channel] = sensitivity;
  const driver::MotionMap whole{channel, 0, 0, driver::kMotionMapSide, driver::kMotionMapSide, nullptr};
  const int status = send_thresholds(card, whole, sensitivity);
  if (status == ZV_OK) write_motion_control(card);
  return status;
}

constexpr u32 blocks_of(u32 pixels) {
  return (pixels + driver::kMotionBlock - 1) / driver::kMotionBlock;
}

int mark_area(ZV_CARD &card, u32 channel, const ZV_RECT *rect, u32 mark) {
  if (channel >= ZV_CHANNELS) return ZV_ERR_CHANNEL;
  if (rect == nullptr || !fits_input(card, *rect)) return ZV_ERR_PARAM;
  // The number of blocks comes from width and height alone, not from the end edges: an area that is not
  // aligned to 16 pixels can miss its last block.
  const driver::MotionMap area{channel,
                               rect->x_start / driver::kMotionBlock,
                               rect->y_start / driver::kMotionBlock,
                               blocks_of(rect->x_end - rect->x_start),
                               blocks_of(rect->y_end - rect->y_start),
                               nullptr};
  if (area.columns == 0 || area.rows == 0) return ZV_OK;
  return send_thresholds(card, area, mark != 0 ? driver::kNeverMoves : card.motion_sensitivity[channel]);
}

int start_detection(ZV_CARD &card) {
  write_motion_control(card);
  const u32 enabled = read_codec(card, driver::kRegMotionEnable);
  write_codec(card, driver::kRegMotionEnable, set_bit(enabled, driver::kMotionEnableMask));
  issue(card.disp_fd, driver::DISP_IOC_MOTION_TRACE_ON);
  return ZV_OK;
}

u32 motion_of(ZV_CARD &card) {
  const u32 motion = ask(card.disp_fd, driver::DISP_IOC_GET_MOTION, card.motion_status);
  return card.motion_status = motion & ~video_loss(card) & kAllChannels;
}

}  // namespace

int stop_motion_detection(ZV_CARD &card) {
  disable_motion(card);
  issue(card.disp_fd, driver::DISP_IOC_MOTION_TRACE_OFF);
  write_motion_control(card);
  return ZV_OK;
}

}  // namespace zarvo

using namespace zarvo;

int zv_GetMotionSensitivity(HANDLE handle, u32 channel, u32 *sensitivity) {
  return status_from(handle, get_sensitivity, channel, sensitivity);
}

int zv_SetMotionSensitivity(HANDLE handle, u32 channel, u32 sensitivity) {
  return status_from(handle, set_sensitivity, channel, sensitivity);
}

int zv_MarkMotionArea(HANDLE handle, u32 channel, const ZV_RECT *rect, u32 mark) {
  return status_from(handle, mark_area, channel, rect, mark);
}

int zv_StartMotionDetection(HANDLE handle) {
  return status_from(handle, start_detection);
}

int zv_StopMotionDetection(HANDLE handle) {
  return status_from(handle, stop_motion_detection);
}

u32 zv_GetMotionStatus(HANDLE handle) {
  return value_from(handle, 0, motion_of);
}
