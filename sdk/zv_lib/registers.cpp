/**
 * @file registers.cpp
 * Raw register access for diagnosis. Every access prints a line.
 */

#include "command.h"
#include "print.h"
#include "zv_card.h"
#include "zv_lib.h"

namespace zarvo {

namespace {

u32 show_codec(const ZV_CARD &card, u32 reg) {
  const u32 value = read_codec(card, reg);
  print("Tarn6400 Register 0x%x = 0x%x.\n", reg, value);
  return value;
}

u8 show_decoder(const ZV_CARD &card, u8 chip, u8 reg) {
  const u8 value = read_decoder(card, chip, reg);
  print("TW2815 %d Register 0x%x = 0x%x.\n", chip, reg, value);
  return value;
}

int get_codec_value(ZV_CARD &card, u32 reg, u32 *value) {
  if (value == nullptr) return ZV_ERR_PARAM;
  *value = show_codec(card, reg);
  return ZV_OK;
}

int set_codec_value(ZV_CARD &card, u32 reg, const u32 *value) {
  if (value == nullptr) return ZV_ERR_PARAM;
  write_codec(card, reg, *value);
  show_codec(card, reg);
  return ZV_OK;
}

int get_decoder_value(ZV_CARD &card, u8 chip, u8 reg, u8 *value) {
  if (chip >= driver::kDecoderChips) return ZV_ERR_DEVICE;
  if (value == nullptr) return ZV_ERR_PARAM;
  *value = show_decoder(card, chip, reg);
  return ZV_OK;
}

int set_decoder_value(ZV_CARD &card, u8 chip, u8 reg, const u8 *value) {
  if (chip >= driver::kDecoderChips) return ZV_ERR_DEVICE;
  if (value == nullptr) return ZV_ERR_PARAM;
  write_decoder(card, chip, reg, *value);
  show_decoder(card, chip, reg);
  return ZV_OK;
}

}  // namespace

}  // namespace zarvo

using namespace zarvo;

int zv_GetTarnRegisterValue(HANDLE handle, u32 reg, u32 *value) {
  return status_from(handle, get_codec_value, reg, value);
}

int zv_SetTarnRegisterValue(HANDLE handle, u32 reg, const u32 *value) {
  return status_from(handle, set_codec_value, reg, value);
}

int zv_GetTW2815RegisterValue(HANDLE handle, u8 chip, u8 reg, u8 *value) {
  return status_from(handle, get_decoder_value, chip, reg, value);
}

int zv_SetTW2815RegisterValue(HANDLE handle, u8 chip, u8 reg, const u8 *value) {
  return status_from(handle, set_decoder_value, chip, reg, value);
}
