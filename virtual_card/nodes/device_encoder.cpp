// Commands of the encoder node, and reads of MPEG-4 and Motion-JPEG frames.
#include "device_encoder.h"

#include <cerrno>

namespace virtual_card {
namespace {

constexpr u32 kScaleCodes[] = {0, 1, 2, driver::kScaleCodeD1};

constexpr CommandRow kCommands[] = {
    VIRTUAL_CARD_COMMAND(EncoderDevice::accept, ENC_IOC_MPEG4_REQUEST),
    VIRTUAL_CARD_COMMAND(EncoderDevice::accept, ENC_IOC_MPEG4_DONE),
    VIRTUAL_CARD_COMMAND(EncoderDevice::set_scale, ENC_IOC_SET_SCALE, First::channel),
    VIRTUAL_CARD_COMMAND(EncoderDevice::set_interval, ENC_IOC_SET_INTERVAL, First::channel),
    VIRTUAL_CARD_COMMAND(EncoderDevice::set_gop, ENC_IOC_SET_GOP, First::channel),
    VIRTUAL_CARD_COMMAND(EncoderDevice::set_qp, ENC_IOC_SET_QP, First::channel),
    VIRTUAL_CARD_COMMAND(EncoderDevice::get_scale, ENC_IOC_GET_SCALE, First::channel, Answer::yes),
    VIRTUAL_CARD_COMMAND(EncoderDevice::get_interval, ENC_IOC_GET_INTERVAL, First::channel, Answer::yes),
    VIRTUAL_CARD_COMMAND(EncoderDevice::get_gop, ENC_IOC_GET_GOP, First::channel, Answer::yes),
    VIRTUAL_CARD_COMMAND(EncoderDevice::get_qp, ENC_IOC_GET_QP, First::channel, Answer::yes),
    VIRTUAL_CARD_COMMAND(EncoderDevice::number_on, ENC_IOC_CHANNEL_NUMBER_ON, First::channel),
    VIRTUAL_CARD_COMMAND(EncoderDevice::number_off, ENC_IOC_CHANNEL_NUMBER_OFF, First::channel),
    VIRTUAL_CARD_COMMAND(EncoderDevice::write_register, ENC_IOC_WRITE_REG),
    VIRTUAL_CARD_COMMAND(EncoderDevice::stop, ENC_IOC_STOP),
    VIRTUAL_CARD_COMMAND(EncoderDevice::set_standard, ENC_IOC_SET_STANDARD),
    VIRTUAL_CARD_COMMAND(EncoderDevice::start, ENC_IOC_START),
    VIRTUAL_CARD_COMMAND(EncoderDevice::set_cbr, ENC_IOC_SET_CBR, First::channel),
    VIRTUAL_CARD_COMMAND(EncoderDevice::set_qp_range, ENC_IOC_SET_QP_RANGE, First::channel),
};

}  // namespace

std::span<const CommandRow> EncoderDevice::table() {
  return kCommands;
}

long EncoderDevice::read(std::uintptr_t, std::size_t count) {
  const bool encoding = board_.encoding.load(std::memory_order_relaxed);
  const auto frame_of = [&](Stream &stream, std::size_t offset, std::size_t end) {
    return stream.read(
        encoding, board_.read_wait(), [&] { return board_.clock.now(); },
        [&](std::span<const u8> area) { region().write(offset, area, end); });
  };
  if (count == driver::kMpeg4ReadSize) return frame_of(board_.mpeg4, 0, driver::kMpeg4AreaSize);
  if (count == driver::kMjpegReadSize)
    return frame_of(board_.mjpeg, driver::kMjpegAreaOffset + driver::kMjpegDescriptorOffset,
                    driver::kStreamRegionSize);
  return -EINVAL;
}

long EncoderDevice::place_mapping(std::size_t length, int, off_t offset) {
  const auto start = static_cast<std::size_t>(offset);
  if (offset < 0 || length > region().size() || start > region().size() - length) return -EINVAL;
  return offset;
}

long EncoderDevice::set_scale(driver::ChannelValue &record) {
  for (const u32 code : kScaleCodes) {
    if (code != record.value) continue;
    settings(record.channel).scale_code = code;
    return 0;
  }
  return -EINVAL;
}

long EncoderDevice::get_scale(driver::ChannelValue &record) {
  record.value = settings(record.channel).scale_code;
  return 0;
}

long EncoderDevice::set_interval(driver::Interval &record) {
  settings(record.channel).interval_code = record.code;
  return 0;
}

long EncoderDevice::get_interval(driver::Interval &record) {
  record.code = settings(record.channel).interval_code;
  return 0;
}

long EncoderDevice::set_gop(driver::ChannelValue &record) {
  settings(record.channel).gop = record.value;
  return 0;
}

long EncoderDevice::get_gop(driver::ChannelValue &record) {
  record.value = settings(record.channel).gop;
  return 0;
}

long EncoderDevice::set_qp(driver::ChannelValue &record) {
  constexpr u32 kMaxQp = 31;
  if (record.value > kMaxQp) return -EINVAL;
  settings(record.channel).qp = record.value;
  return 0;
}

long EncoderDevice::get_qp(driver::ChannelValue &record) {
  record.value = settings(record.channel).qp;
  return 0;
}

long EncoderDevice::set_cbr(driver::Cbr &record) {
  settings(record.channel).cbr = record;
  return 0;
}

long EncoderDevice::set_qp_range(driver::QpRange &record) {
  settings(record.channel).qp_range = record;
  return 0;
}

long EncoderDevice::number_on(u32 &channel) {
  settings(channel).number_overlay = true;
  return 0;
}

long EncoderDevice::number_off(u32 &channel) {
  settings(channel).number_overlay = false;
  return 0;
}

long EncoderDevice::write_register(driver::Register &record) {
  board_.write_codec(record.address, record.value);
  return 0;
}

long EncoderDevice::set_standard(u32 &standard) {
  return board_.set_standard(standard);
}

long EncoderDevice::start() {
  if (board_.encoding) return 0;
  board_.settings.encoding_since = board_.clock.now();
  board_.settings.state.encoding = true;
  ++board_.settings.session;
  board_.encoding = true;
  return 0;
}

long EncoderDevice::stop() {
  board_.stop_encoding();
  return 0;
}

}  // namespace virtual_card
