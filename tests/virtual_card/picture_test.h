/**
 * @file picture_test.h
 * The world of the tests of the picture side alone: an engine without nodes or clock, and what a host decodes
 * of its frames.
 */
#ifndef PICTURE_TEST_H
#define PICTURE_TEST_H

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <map>
#include <optional>

#include "picture/av_ptr.h"
#include "picture/engine.h"
#include "picture/frame_mark.h"
#include "support.h"

namespace driver = zarvo::driver;
using card::Area, card::Colour, card::FrameMark;

constexpr u32 kHalfD1 = SCALE_ZV_HALF_D1, kCif = SCALE_ZV_CIF, kD1 = driver::kScaleCodeD1;

bool near(Colour a, Colour b, int tolerance = 12);

/// A frame of a stream, and the picture that a host decodes, 4:2:0.
struct Frame {
  unsigned channel = 0;
  bool intra = true;
  std::int64_t microseconds = 0;
  std::vector<u8> bytes;  ///< without the host's header
  u32 width = 0, height = 0;
  bool interlaced = false;
  std::vector<u8> samples;  ///< Y, Cb, Cr

  std::optional<FrameMark> mark() const {
    return card::read_frame_mark(samples.data(), width, width, height);
  }
  /// The colour at a point given in hundredths of the picture's size.
  Colour at(u32 x_percent, u32 y_percent) const;
};

/// The samples of one input's sound.
std::vector<std::int16_t> decode_g726(const std::vector<u8> &bytes);

/// An engine at power-up that encodes, with every window of the preview enabled but without a place.
class PictureTest : public testing::Test {
 protected:
  PictureTest() { power_up(); }

  void power_up();
  void encode(unsigned channel, u32 scale_code, u32 interval_code = 1, u32 gop = 10, u32 qp = 4);
  /// Draws and encodes the next fields.
  void fields(int count);
  /// Takes the frames of a stream and decodes them behind the host's headers. A frame that the decoder
  /// complains about fails the test.
  std::vector<Frame> take(card::FrameQueue &stream);
  /// Runs to the end of the next frame and returns a channel's newest JPEG picture.
  Frame look(unsigned channel);

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
  std::int64_t next = 0;                                     ///< number of the next field
  std::vector<u8> screen;                                    ///< the preview
  std::map<unsigned, card::AvPtr<AVCodecContext>> decoders;  ///< of the MPEG-4 stream, by channel
};

#endif
