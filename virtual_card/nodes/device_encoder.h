/**
 * @file device_encoder.h
 * The encoder node.
 */
#ifndef VIRTUAL_CARD_DEVICE_ENCODER_H
#define VIRTUAL_CARD_DEVICE_ENCODER_H

#include "device.h"

namespace virtual_card {

/// /dev/zarvo_enc0: encoder settings, start and stop, MPEG-4 and Motion-JPEG frames.
class EncoderDevice : public DeviceNode {
 public:
  explicit EncoderDevice(Board &board) : DeviceNode(board, Device::encoder, board.stream_region) {}

  long read(std::uintptr_t buffer, std::size_t count) override;
  long place_mapping(std::size_t length, int protection, off_t offset) override;

  long set_scale(driver::ChannelValue &record);
  long get_scale(driver::ChannelValue &record);
  long set_interval(driver::Interval &record);
  long get_interval(driver::Interval &record);
  long set_gop(driver::ChannelValue &record);
  long get_gop(driver::ChannelValue &record);
  long set_qp(driver::ChannelValue &record);
  long get_qp(driver::ChannelValue &record);
  long set_cbr(driver::Cbr &record);
  long set_qp_range(driver::QpRange &record);
  long number_on(u32 &channel);
  long number_off(u32 &channel);
  long write_register(driver::Register &record);
  long set_standard(u32 &standard);
  long start();
  long stop();
  long accept() { return 0; }

  static std::span<const CommandRow> table();

 private:
  EncoderSettings &settings(u32 channel) { return board_.settings.state.channel[channel].encoder; }
};

}  // namespace virtual_card

#endif
