// Commands of the video-input node.
#include "device_video_input.h"

#include <algorithm>
#include <cerrno>
#include <cstring>

#include "host/user_memory.h"

namespace virtual_card {
namespace {

constexpr CommandRow kCommands[] = {
    VIRTUAL_CARD_COMMAND(VideoInputDevice::set_mask, VIN_IOC_SET_MASK, First::channel),
    VIRTUAL_CARD_COMMAND(VideoInputDevice::set_motion_map, VIN_IOC_SET_MOTION_MAP, First::channel),
    VIRTUAL_CARD_COMMAND(VideoInputDevice::set_standard, VIN_IOC_SET_STANDARD),
    VIRTUAL_CARD_COMMAND(VideoInputDevice::read_register, VIN_IOC_READ_REG, First::word, Answer::yes),
    VIRTUAL_CARD_COMMAND(VideoInputDevice::write_register, VIN_IOC_WRITE_REG),
    VIRTUAL_CARD_COMMAND(VideoInputDevice::read_decoder, VIN_IOC_READ_TW2815, First::word, Answer::yes),
    VIRTUAL_CARD_COMMAND(VideoInputDevice::write_decoder, VIN_IOC_WRITE_TW2815),
    VIRTUAL_CARD_COMMAND(VideoInputDevice::set_width, VIN_IOC_SET_WIDTH),
    VIRTUAL_CARD_COMMAND(VideoInputDevice::board_command, VIN_IOC_BOARD_CMD, First::word, Answer::yes),
    VIRTUAL_CARD_COMMAND(VideoInputDevice::get_motion_levels, VIN_IOC_GET_MOTION_LEVELS, First::word,
                         Answer::yes),
};

bool fits(const driver::MotionMap &map) {
  const auto inside = [](u32 first, u32 count) {
    return count > 0 && first < driver::kMotionMapSide && count <= driver::kMotionMapSide - first;
  };
  return inside(map.column, map.columns) && inside(map.row, map.rows);
}

/// Copies the thresholds of a map from the host. Returns 0 or a negated error number.
long fetch_thresholds(const driver::MotionMap &map, std::vector<u16> &thresholds) {
  if (!fits(map)) return -EINVAL;
  thresholds.resize(std::size_t{map.columns} * map.rows);
  return copy_from_user(thresholds.data(), reinterpret_cast<std::uintptr_t>(map.thresholds),
                        thresholds.size() * sizeof(u16));
}

}  // namespace

std::span<const CommandRow> VideoInputDevice::table() {
  return kCommands;
}

/// Rounds the mask to the chip's units of 8 pixels and lines: outward, so that nothing it should hide is
/// visible.
long VideoInputDevice::set_mask(driver::Mask &mask) {
  if (mask.x_end < mask.x_start || mask.y_end < mask.y_start) return -EINVAL;
  if (mask.x_end > kMaxWidth || mask.y_end > kMaxLines) return -EINVAL;
  const auto down = [](u32 edge) { return edge / driver::kMaskUnit; };
  const auto up = [](u32 edge) { return (edge + driver::kMaskUnit - 1) / driver::kMaskUnit; };
  const bool empty = mask.x_end == mask.x_start || mask.y_end == mask.y_start;
  const driver::Mask units{mask.channel, down(mask.x_start), empty ? down(mask.x_end) : up(mask.x_end),
                           down(mask.y_start), empty ? down(mask.y_end) : up(mask.y_end)};
  board_.write_video_input(driver::kRegPrivacyMask + 4 * mask.channel, driver::packed_mask(units));
  return 0;
}

long VideoInputDevice::set_motion_map(driver::MotionMap &map) {
  std::vector<u16> thresholds;
  if (const long error = fetch_thresholds(map, thresholds)) return error;
  map.thresholds = thresholds.data();
  board_.engine.set_thresholds(map);
  if (map.columns == driver::kMotionMapSide && map.rows == driver::kMotionMapSide)
    board_.settings.motion_level[map.channel] = thresholds.front();
  return 0;
}

long VideoInputDevice::set_standard(u32 &standard) {
  return board_.set_standard(standard);
}

long VideoInputDevice::read_register(driver::Register &record) {
  record.value = board_.read_register(board_.settings.video_input, record.address);
  return 0;
}

long VideoInputDevice::write_register(driver::Register &record) {
  board_.write_video_input(record.address, record.value);
  return 0;
}

long VideoInputDevice::read_decoder(driver::DecoderRegister &record) {
  if (record.chip >= driver::kDecoderChips) return -EINVAL;
  record.value = board_.settings.decoders.read(record.chip, record.address, board_.settings.state);
  return 0;
}

long VideoInputDevice::write_decoder(driver::DecoderRegister &record) {
  if (record.chip >= driver::kDecoderChips) return -EINVAL;
  board_.write_decoder(record.chip, record.address, record.value);
  return 0;
}

long VideoInputDevice::set_width(u32 &width) {
  if (width != kMaxWidth && width != kNarrowWidth) return -EINVAL;
  board_.settings.state.width = width;
  return 0;
}

long VideoInputDevice::board_command(driver::BoardCommand &record) {
  record.reply = board_.settings.controller.command(record.command, board_.clock.now());
  return 0;
}

long VideoInputDevice::get_motion_levels(driver::MotionLevels &levels) {
  std::copy(board_.settings.motion_level.begin(), board_.settings.motion_level.end(), levels.level);
  return 0;
}

void VideoInputDevice::log_pointed_to(u32 code, const void *record, std::vector<u8> &log) const {
  if (code != driver::VIN_IOC_SET_MOTION_MAP) return;
  driver::MotionMap map;
  std::memcpy(&map, record, sizeof map);
  std::vector<u16> thresholds;
  if (fetch_thresholds(map, thresholds) != 0) return;
  const auto *bytes = reinterpret_cast<const u8 *>(thresholds.data());
  log.insert(log.end(), bytes, bytes + thresholds.size() * sizeof(u16));
}

}  // namespace virtual_card
