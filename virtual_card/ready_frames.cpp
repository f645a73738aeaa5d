// Builds ready-made frames with correct descriptors.
#include <cstring>

#include "card_state.h"

namespace virtual_card {
namespace {

void put_word(std::vector<std::uint8_t> &bytes, std::size_t offset, u32 value) {
  for (unsigned n = 0; n < sizeof value; ++n) bytes[offset + n] = static_cast<u8>(value >> 8 * n);
}

}  // namespace

ReadyFrame mpeg4_frame(unsigned channel, unsigned type, const std::vector<std::uint8_t> &bitstream,
                       std::chrono::microseconds time) {
  constexpr long kSecond = 1'000'000;
  const auto length = static_cast<u32>(bitstream.size());
  ReadyFrame frame;
  frame.area.resize(driver::kMpeg4DescriptorSize);
  put_word(frame.area, 0, driver::packed_head({channel, type, length}));
  put_word(frame.area, driver::kMpeg4TimeSeconds, static_cast<u32>(time.count() / kSecond));
  put_word(frame.area, driver::kMpeg4TimeMicroseconds, static_cast<u32>(time.count() % kSecond));
  frame.area.insert(frame.area.end(), bitstream.begin(), bitstream.end());
  frame.result = static_cast<long>(frame.area.size());
  return frame;
}

ReadyFrame mjpeg_frame(unsigned channel, unsigned width, unsigned height,
                       const std::vector<std::uint8_t> &scan) {
  ReadyFrame frame;
  frame.area.resize(driver::kMjpegDescriptorSize);
  put_word(frame.area, offsetof(driver::MjpegDescriptor, channel), channel);
  put_word(frame.area, offsetof(driver::MjpegDescriptor, width), width);
  put_word(frame.area, offsetof(driver::MjpegDescriptor, height), height);
  frame.area.insert(frame.area.end(), scan.begin(), scan.end());
  frame.result = static_cast<long>(frame.area.size());
  return frame;
}

}  // namespace virtual_card
