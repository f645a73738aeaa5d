/**
 * @file standard.cpp
 * Video standard and input width.
 */
#include "command.h"
#include "internal.h"
#include "zv_bits.h"
#include "zv_card.h"
#include "zv_lib.h"

namespace zarvo {

PictureSize input_picture(const ZV_CARD &card) {
  return {input_width(card.resolution), card.standard == VIDEO_STANDARD_ZV_NTSC ? 480u : 576u};
}

bool fits_input(const ZV_CARD &card, const ZV_RECT &rect) {
  const PictureSize picture = input_picture(card);
  return rect.x_start <= rect.x_end && rect.x_end <= picture.width && rect.y_start <= rect.y_end &&
         rect.y_end <= picture.height;
}

int set_video_standard(ZV_CARD &card, u32 standard) {
  if (standard > VIDEO_STANDARD_ZV_PAL) return ZV_ERR_STANDARD;
  card.standard = standard;
  const u32 running = get_bit(read_codec(card, driver::kRegDisplayState), driver::kDisplayStateBit);
  u32 word = standard;
  issue(card.vin_fd, driver::VIN_IOC_SET_STANDARD, word);
  issue(card.enc_fd, driver::ENC_IOC_SET_STANDARD, word);
  issue(card.disp_fd, driver::DISP_IOC_SET_STANDARD, word);
  if (running != 0) open_display(card, card.display.mode);
  const u32 state = read_codec(card, driver::kRegDisplayState);
  write_codec(card, driver::kRegDisplayState, restore_bit(state, driver::kDisplayStateBit, running));
  return ZV_OK;
}

namespace {

int set_resolution(ZV_CARD &card, u32 resolution) {
  if (resolution > RESOLUTION_ZV_704) return ZV_ERR_RESOLUTION;
  card.resolution = resolution;
  issue(card.vin_fd, driver::VIN_IOC_SET_WIDTH, u32{input_picture(card).width});
  set_video_standard(card, card.standard);
  set_preview_mode(card, card.display.mode);
  return ZV_OK;
}

u32 resolution_of(ZV_CARD &card) {
  return card.resolution;
}

u32 standard_of(ZV_CARD &card) {
  return card.standard;
}

}  // namespace

}  // namespace zarvo

using namespace zarvo;

u32 zv_GetResolution(HANDLE handle) {
  return value_from(handle, 0, resolution_of);
}

int zv_SetResolution(HANDLE handle, u32 resolution) {
  return status_from(handle, set_resolution, resolution);
}

u32 zv_GetVideoStandard(HANDLE handle) {
  return value_from(handle, 0, standard_of);
}

int zv_SetVideoStandard(HANDLE handle, u32 standard) {
  return status_from(handle, set_video_standard, standard);
}
