/**
 * @file device_video_input.h
 * The video-input node.
 */
#ifndef VIRTUAL_CARD_DEVICE_VIDEO_INPUT_H
#define VIRTUAL_CARD_DEVICE_VIDEO_INPUT_H

#include "device.h"

namespace virtual_card {

/// /dev/zarvo_vin0: decoders, privacy masks, motion maps, routing, board controller.
class VideoInputDevice : public DeviceNode {
 public:
  explicit VideoInputDevice(Board &board)
      : DeviceNode(board, Device::video_input, board.video_input_region) {}

  long set_mask(driver::Mask &mask);
  long set_motion_map(driver::MotionMap &map);
  long set_standard(u32 &standard);
  long read_register(driver::Register &record);
  long write_register(driver::Register &record);
  long read_decoder(driver::DecoderRegister &record);
  long write_decoder(driver::DecoderRegister &record);
  long set_width(u32 &width);
  long board_command(driver::BoardCommand &record);
  long get_motion_levels(driver::MotionLevels &levels);

  static std::span<const CommandRow> table();

 protected:
  void log_pointed_to(u32 code, const void *record, std::vector<u8> &log) const override;
};

}  // namespace virtual_card

#endif
