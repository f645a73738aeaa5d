/**
 * @file picture.cpp
 * Picture properties: converts user units to and from the registers of the video decoders.
 */
#include <algorithm>

#include "command.h"
#include "internal.h"
#include "zv_card.h"
#include "zv_picture.h"

namespace zarvo {

namespace {

/// A member of ZV_VIDEO_PROPERTY and its user range, which maps to the 256 steps of a register.
struct Property {
  i32 ZV_VIDEO_PROPERTY::*field;
  i32 min;
  i32 max;
};

/// The properties in the order of their registers.
constexpr Property kProperties[] = {{&ZV_VIDEO_PROPERTY::hue, -180, 180},
                                    {&ZV_VIDEO_PROPERTY::saturation, 0, 200},
                                    {&ZV_VIDEO_PROPERTY::contrast, 0, 200},
                                    {&ZV_VIDEO_PROPERTY::brightness, -25, 25}};
constexpr i32 kSteps = 256;

constexpr i32 even_toward_zero(i32 value) {
  return value - value % 2;
}

/// The increment for rounding up a value between two steps. Hue is even, so it is rounded up by 2.
constexpr i32 round_up(const Property &property) {
  return property.field == &ZV_VIDEO_PROPERTY::hue ? 2 : 1;
}

}  // namespace

void translate_video_property(ZV_VIDEO_PROPERTY &reg, ZV_VIDEO_PROPERTY &user) {
  user.hue = even_toward_zero(user.hue);
  for (const Property &property : kProperties) {
    const i32 value = (user.*property.field - property.min) * kSteps / (property.max - property.min);
    reg.*property.field = std::min(value, kSteps - 1);
  }
}

void inverse_translate_video_property(ZV_VIDEO_PROPERTY &user, const ZV_VIDEO_PROPERTY &reg) {
  for (const Property &property : kProperties) {
    const i32 scaled = reg.*property.field * (property.max - property.min);
    user.*property.field = scaled / kSteps + property.min + (scaled % kSteps != 0 ? round_up(property) : 0);
  }
  user.hue = even_toward_zero(user.hue);
}

namespace {

/// The decoder of a channel and the address of the first of its four property registers.
struct PropertyBlock {
  u8 chip;
  u8 address;
};

PropertyBlock property_block(u32 channel) {
  return {static_cast<u8>(channel / driver::kChannelsPerChip),
          static_cast<u8>(channel % driver::kChannelsPerChip * driver::kDecoderChannelStride +
                          driver::kDecoderProperty)};
}

int get_property(ZV_CARD &card, u32 channel, ZV_VIDEO_PROPERTY *property) {
  if (channel >= ZV_CHANNELS) return ZV_ERR_CHANNEL;
  if (property == nullptr) return ZV_ERR_PARAM;
  auto [chip, address] = property_block(channel);
  ZV_VIDEO_PROPERTY reg{};
  for (const Property &entry : kProperties) reg.*entry.field = read_decoder(card, chip, address++);
  inverse_translate_video_property(*property, reg);
  return ZV_OK;
}

int set_property(ZV_CARD &card, u32 channel, ZV_VIDEO_PROPERTY *property) {
  if (channel >= ZV_CHANNELS) return ZV_ERR_CHANNEL;
  if (property == nullptr) return ZV_ERR_PARAM;
  for (const Property &entry : kProperties) {
    const i32 value = property->*entry.field;
    if (value < entry.min || value > entry.max) return ZV_ERR_PARAM;
  }
  ZV_VIDEO_PROPERTY reg{};
  translate_video_property(reg, *property);
  auto [chip, address] = property_block(channel);
  for (const Property &entry : kProperties)
    write_decoder(card, chip, address++, static_cast<u8>(reg.*entry.field));
  card.property[channel] = *property;
  return ZV_OK;
}

}  // namespace

}  // namespace zarvo

using namespace zarvo;

int zv_GetVideoProperty(HANDLE handle, u32 channel, ZV_VIDEO_PROPERTY *property) {
  return status_from(handle, get_property, channel, property);
}

int zv_SetVideoProperty(HANDLE handle, u32 channel, ZV_VIDEO_PROPERTY *property) {
  return status_from(handle, set_property, channel, property);
}
