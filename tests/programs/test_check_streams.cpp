// What zarvo_check says of captures at the driver: descriptors, times, rates, losses.
#include <cerrno>
#include <cstring>

#include "check_test.h"
#include "programs/check/streams.h"

namespace contract {
namespace {

constexpr u32 kChannels = 15;  // channel 16 is not encoded
constexpr int kFrames = 59;
constexpr double kPeriod = 1001.0 / 30000, kWall = 5000;  // the wall clock is ahead of the monotonic one

DriverCapture good_capture() {
  DriverCapture capture{100, 102, (1u << kChannels) - 1, {}, {}, {}, {}, {}};
  for (u32 n = 0; n < u32{kFrames}; ++n) {
    const double time = 100.04 + n * kPeriod;
    const u32 type = n % 30 == 0 ? 0 : 1;
    for (u32 channel = 0; channel < kChannels; ++channel) {
      capture.mpeg4.push_back({time, kWall + time, 1064, {channel, type, 1000}, kWall + time - 0.05, type});
      capture.mjpeg.push_back({time, 2016, {channel, 352, 240, 0}, true});
    }
    capture.preview.push_back({time, 720 * 480 * 2, n % 4});
  }
  for (u32 n = 0; n < 123; ++n) capture.audio.push_back({100.02 + n / 62.5, 4, 0});
  return capture;
}

Mpeg4Read &mpeg4_of(DriverCapture &capture, u32 frame, u32 channel) {
  return capture.mpeg4[frame * kChannels + channel];
}
constexpr u32 kAll = 99;
/// Takes the frames of a channel away, or of all, from the time of a frame to before that of another one.
template <typename Read>
void lose(std::vector<Read> &reads, u32 channel, int first, int end) {
  std::erase_if(reads, [=](const Read &read) {
    const double frame = (read.time - 100.04) / kPeriod;
    return (channel == kAll || channel_of(read) == channel) && frame > first - 0.5 && frame < end - 0.5;
  });
}

using C = DriverCapture;

TEST(CheckStreams, EachFaultIsNoticed) {
  const auto arriving = [](double late) {
    return [late](C &c) {
      for (auto &frame : c.mpeg4) frame.wall += late;
      c.mpeg4[0].stamp = 0;  // one frame does not count
    };
  };
  const auto late = [](C &c) {
    for (u32 n = 20; n < 30; ++n) mpeg4_of(c, n, 5).time += 1;
  };
  const auto frozen = [](C &c) {
    for (OtherRead &read : c.preview) read.index = 2;
  };
  const Checks checks = all_checks();
  PreparedBench bench;
  const auto present = [&](const C &capture) -> const Checks & {
    bench.taken = capture;
    return checks;
  };
  const std::vector<Row<C>> rows{
      {"mpeg4.read.no-error", kBroken, [](C &c) { c.errors[0] = EIO; }},
      {"mjpeg.read.no-error", kBroken, [](C &c) { c.errors[1] = EIO; }},
      {"audio.read.no-error", kBroken, [](C &c) { c.errors[2] = EIO; }},
      {"preview.read.no-error", kBroken, [](C &c) { c.errors[3] = EIO; }},
      {"mpeg4.read.length", kBroken, [](C &c) { mpeg4_of(c, 58, 14).result = 1063; }},
      {"mpeg4.read.length", kBroken, [](C &c) { mpeg4_of(c, 0, 0).head.length = 0; }},
      {"mpeg4.read.length", kBroken, [](C &c) { mpeg4_of(c, 3, 2).result = 0x100001; }},
      {"mpeg4.descriptor.channel", kBroken, [](C &c) { mpeg4_of(c, 7, 3).head.channel = 15; }},
      {"mpeg4.descriptor.channel", kBroken, [](C &c) { lose(c.mpeg4, 14, 0, kFrames); }},
      {"mpeg4.descriptor.type", kBroken, [](C &c) { mpeg4_of(c, 30, 9).head.type = 1; }},
      {"mpeg4.descriptor.type", kBroken, [](C &c) { mpeg4_of(c, 31, 9).picture_type = 4; }},
      {"mjpeg.read.length", kHeld, [](C &c) { c.mjpeg[9].result = 17; }},
      {"mjpeg.read.length", kBroken, [](C &c) { c.mjpeg[9].result = 16; }},
      {"mjpeg.descriptor.channel", kBroken, [](C &c) { c.mjpeg[9].descriptor.channel = 33; }},
      {"mjpeg.descriptor.size", kBroken, [](C &c) { c.mjpeg[9].descriptor.height = 288; }},
      {"mjpeg.eoi", kBroken, [](C &c) { c.mjpeg.back().ends_with_eoi = false; }},
      {"audio.read.blocks", kHeld, [](C &c) { c.audio[5].result = 192; }},
      {"audio.read.blocks", kBroken, [](C &c) { c.audio[5].result = 3; }},
      {"preview.read.size", kBroken, [](C &c) { c.preview[5].result = 720 * 576 * 2; }},
      {"preview.read.index", kBroken, [](C &c) { c.preview[5].index = 4; }},
      {"mpeg4.start.intra", kBroken, [](C &c) { lose(c.mpeg4, 9, 0, 1); }},
      {"mpeg4.start.soon", kHeld, [](C &c) { lose(c.mpeg4, kAll, 0, 13); }},
      {"mpeg4.start.soon", kBroken, [](C &c) { lose(c.mpeg4, 14, 0, 14); }},
      {"mpeg4.stamp.wall-clock", kHeld, arriving(0.34)},
      {"mpeg4.stamp.wall-clock", kBroken, arriving(0.36)},
      {"mpeg4.stamp.wall-clock", kBroken, arriving(-0.16)},
      {"mpeg4.gap", kHeld, [](C &c) { lose(c.mpeg4, 6, 20, 30); }},
      {"audio.start.soon", kBroken, [](C &c) { lose(c.audio, kAll, -1, 16); }},
      {"mpeg4.stamp.rises", kBroken, [](C &c) { mpeg4_of(c, 20, 4).stamp = mpeg4_of(c, 19, 4).stamp; }},
      {"mpeg4.stamp.rises", kHeld, [](C &c) { mpeg4_of(c, 20, 4).stamp -= kPeriod * 0.9; }},
      {"mpeg4.gap", kBroken, [](C &c) { lose(c.mpeg4, 6, 20, 32); }},
      {"mpeg4.gap", kBroken, [](C &c) { lose(c.mpeg4, 6, 45, kFrames); }},
      {"mjpeg.gap", kBroken, [](C &c) { lose(c.mjpeg, 14, 20, 32); }},
      {"audio.gap", kBroken, [](C &c) { lose(c.audio, kAll, 20, 33); }},
      {"preview.rate", kBroken, [](C &c) { lose(c.preview, kAll, 40, kFrames); }},
      {"preview.rate", kBroken, frozen},
      {"load.mpeg4.gap", kHeld, [](C &c) { lose(c.mpeg4, 14, 20, 21); }},
      {"load.mpeg4.gap", kBroken, [](C &c) { lose(c.mpeg4, 14, 20, 22); }},
      {"load.mpeg4.complete", kHeld, [](C &c) { lose(c.mpeg4, 14, 10, 16); }},
      {"load.mpeg4.complete", kBroken, [](C &c) { lose(c.mpeg4, 14, 10, 18); }},
      {"load.mjpeg.complete", kBroken, [](C &c) { lose(c.mjpeg, 0, 10, 18); }},
      {"load.audio.complete", kBroken, [](C &c) { c.audio.resize(110); }},
      {"load.preview.rate", kBroken, [](C &c) { lose(c.preview, kAll, 0, 12); }},
      {"load.pause.mpeg4", kBroken, [](C &c) { lose(c.mpeg4, 14, 20, kFrames); }},
      {"load.pause.mjpeg", kBroken, [](C &c) { lose(c.mjpeg, 14, 20, 25); }},
      {"load.pause.audio", kBroken, [](C &c) { c.audio.resize(117); }},
      {"load.mpeg4.gap", kHeld, late},
  };
  expect_rows(good_capture(), bench, present, rows);
}

// The bytes are written by hand: a field that is read from the wrong place shows.
TEST(CheckRegion, BytesBecomeReads) {
  std::vector<u8> region(0x200000, 0x77);
  const auto put = [&region](std::size_t at, std::vector<u8> bytes) {
    std::ranges::copy(bytes, region.begin() + static_cast<std::ptrdiff_t>(at));
  };
  put(0, {0x05, 0x01, 0x4A, 0x0B});  // channel 11, type 1, 0xA0105 bytes
  put(20, {0x10, 0x27, 0, 0, 0x20, 0xA1, 0x07, 0});
  put(64, {0, 0, 1, 0xB6, 0x40});
  const Mpeg4Read frame = mpeg4_read(region.data(), 777);
  EXPECT_EQ(std::tuple(frame.result, frame.head.channel, frame.head.type, frame.head.length),
            std::tuple(777, 11u, 1u, 0xA0105u));
  EXPECT_DOUBLE_EQ(frame.stamp, 10000.5);
  const struct {
    std::vector<u8> bytes;
    u8 length;
    u32 type;
  } starts[] = {{{0, 0, 1, 0xB6, 0x3F}, 9, 0},
                {{0, 0, 1, 0xB6, 0x40}, 5, 1},
                {{0, 0, 1, 0xB6, 0x3F}, 4, 4},
                {{0, 0, 1, 0xB3, 0x3F}, 9, 4}};
  for (const auto &start : starts) {
    put(0, {start.length, 0, 0, 0});
    put(64, start.bytes);
    EXPECT_EQ(mpeg4_read(region.data(), 100).picture_type, start.type) << testing::PrintToString(start.bytes);
  }
  put(0x100400, {17, 1, 0, 0, 0xD0, 2, 0, 0, 0xE0, 1, 0, 0});
  const driver::MjpegDescriptor descriptor = mjpeg_read(region.data(), 100).descriptor;
  EXPECT_EQ(std::tuple(descriptor.channel, descriptor.width, descriptor.height),
            std::tuple(273u, 720u, 480u));
  const struct {
    std::vector<u8> data;
    long result;
    bool eoi;
  } ends[] = {{{1, 0xFF, 0xD9}, 19, true},
              {{1, 0xFF, 0xD9}, 18, false},
              {{0xFF, 0xD9, 0, 0}, 20, true},
              {{0xFF, 0xD9, 3, 0xD9}, 20, false}};
  for (const auto &end : ends) {
    put(0x100410, end.data);
    EXPECT_EQ(mjpeg_read(region.data(), end.result).ends_with_eoi, end.eoi)
        << testing::PrintToString(end.data) << end.result;
  }
}

}  // namespace
}  // namespace contract
