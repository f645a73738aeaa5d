/**
 * @file picture_test.h
 * The world of the tests of the picture side alone: an engine without nodes or clock, and decoders for what
 * it makes.
 */
#ifndef PICTURE_TEST_H
#define PICTURE_TEST_H

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <optional>

#include "picture/engine.h"
#include "picture/frame_mark.h"
#include "support.h"

namespace driver = zarvo::driver;
using card::Area, card::Colour, card::FrameMark;

constexpr u32 kHalfD1 = SCALE_ZV_HALF_D1, kCif = SCALE_ZV_CIF, kD1 = driver::kScaleCodeD1;

/// A decoded picture, 4:2:0.
struct Decoded {
  u32 width = 0;
  u32 height = 0;
  bool intra = false;
  bool interlaced = false;
  std::vector<u8> y, cb, cr;

  std::optional<FrameMark> mark() const { return card::read_frame_mark(y.data(), width, width, height); }
  /// The colour at a point given in hundredths of the picture's size.
  Colour at(u32 x, u32 y_percent) const {
    const std::size_t px = width * x / 100, py = height * y_percent / 100;
    const std::size_t chroma = py / 2 * (width / 2) + px / 2;
    return {y[py * width + px], cb[chroma], cr[chroma]};
  }
};

inline bool near(Colour a, Colour b, int tolerance = 12) {
  return std::abs(a.y - b.y) <= tolerance && std::abs(a.cb - b.cb) <= tolerance &&
         std::abs(a.cr - b.cr) <= tolerance;
}

/// A frame as the host gets it; its bytes follow the host's header.
struct Encoded {
  unsigned channel = 0;
  bool intra = false;
  u32 width = 0;
  u32 height = 0;
  std::int64_t microseconds = 0;
  std::vector<u8> bytes;
};

/// Decodes a channel's MPEG-4 stream, with the host's header in front of each intra frame. Any complaint of
/// the decoder fails the test.
std::vector<Decoded> decode_mpeg4(const std::vector<Encoded> &frames, u32 width, u32 height, bool interlaced);
Decoded decode_jpeg(const Encoded &frame);
std::vector<std::int16_t> decode_g726(const std::vector<u8> &bytes);

/// An engine at power-up that encodes, with every window of the preview enabled but without a place.
class PictureTest : public testing::Test {
 protected:
  PictureTest() { power_up(); }

  void power_up();
  void encode(unsigned channel, u32 scale_code, u32 interval_code = 1, u32 gop = 10, u32 qp = 4);
  /// Draws and encodes the next fields.
  void fields(int count);
  std::vector<Encoded> take_mpeg4();
  std::vector<Encoded> take_jpeg();
  /// Runs to the end of the next frame and returns a channel's newest picture, from the JPEG encoder.
  Decoded look(unsigned channel);

  void window(unsigned number, Area area, u32 flags = ZV_WINDOW_ENABLED) {
    state.display.layout.window[number] = {number,       number,     1,          area.x_start,
                                           area.y_start, area.x_end, area.y_end, flags};
  }
  /// Composes the preview.
  void compose() {
    screen.assign(std::size_t{state.width} * state.lines() * 2, 0);
    engine.compose(state, screen);
  }
  Colour pixel(u32 x, u32 y) const { return pixel_of(screen, x, y); }
  Colour pixel_of(const std::vector<u8> &uyvy, u32 x, u32 y) const {
    const u8 *pair = uyvy.data() + (std::size_t{y} * state.width + (x & ~1u)) * 2;
    return {pair[1 + (x & 1) * 2], pair[0], pair[2]};
  }

  static constexpr std::size_t kCapacity = std::size_t{1} << 28;
  card::FrameQueue mpeg4{kCapacity}, mjpeg{kCapacity}, audio{kCapacity};
  card::Engine engine{mpeg4, mjpeg, audio};
  card::CardState state;
  std::int64_t next = 0;   ///< number of the next field
  std::vector<u8> screen;  ///< the preview
};

#endif
