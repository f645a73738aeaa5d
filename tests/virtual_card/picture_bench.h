/**
 * @file picture_bench.h
 * An engine without a card around it, and decoders for what it makes.
 */
#ifndef PICTURE_BENCH_H
#define PICTURE_BENCH_H

#include <cmath>
#include <cstdlib>
#include <optional>
#include <vector>

#include "picture/engine.h"
#include "picture/frame_mark.h"

namespace virtual_card {

/// A decoded picture, 4:2:0.
struct Decoded {
  u32 width = 0;
  u32 height = 0;
  bool intra = false;
  bool interlaced = false;
  std::vector<u8> y, cb, cr;

  std::optional<FrameMark> mark() const { return read_frame_mark(y.data(), width, width, height); }
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

inline Colour pixel_of(const std::vector<u8> &uyvy, u32 width, u32 x, u32 y) {
  const u8 *pair = uyvy.data() + (std::size_t{y} * width + (x & ~1u)) * 2;
  return {pair[1 + (x & 1) * 2], pair[0], pair[2]};
}

/// A frame as the host would get it: what it carries, and the bytes behind the host's header.
struct Encoded {
  unsigned channel = 0;
  bool intra = false;
  u32 width = 0;
  u32 height = 0;
  std::int64_t microseconds = 0;
  std::vector<u8> bytes;
};

/// Decodes a channel's MPEG-4 stream, the host's header put before each intra frame. Any complaint of
/// the decoder fails the test.
std::vector<Decoded> decode_mpeg4(const std::vector<Encoded> &frames, u32 width, u32 height, bool interlaced);
Decoded decode_jpeg(const Encoded &frame);
std::vector<std::int16_t> decode_g726(const std::vector<u8> &bytes);

class PictureBench {
 public:
  static constexpr std::size_t kCapacity = std::size_t{1} << 28;

  PictureBench() {
    state.encoding = true;
    for (unsigned i = 0; i < 16; ++i) {
      state.display.layout.window[i] = {i, i, 0, 0, 0, 0, 0, ZV_WINDOW_ENABLED};
      state.display.routing[i] = i;
    }
  }

  void encode(unsigned channel, u32 scale_code, u32 interval_code, u32 gop = 10, u32 qp = 4) {
    EncoderSettings &encoder = state.channel[channel].encoder;
    encoder.scale_code = scale_code;
    encoder.interval_code = interval_code;
    encoder.gop = gop;
    encoder.qp = qp;
  }
  void fields(int count) {
    for (const std::int64_t end = next + count; next < end; ++next) {
      const auto passed = std::chrono::duration_cast<std::chrono::microseconds>(
          video_standard(state.standard).duration(next));
      engine.field(state, {state.standard, next, std::chrono::microseconds(1'700'000'000'000'000) + passed});
    }
  }
  std::vector<Encoded> take_mpeg4();
  std::vector<Encoded> take_jpeg();
  /// Runs to the end of the next frame and gives a channel's newest picture through the JPEG encoder.
  Decoded look(unsigned channel);

  /// The preview, and a colour in it.
  void compose() {
    screen.assign(std::size_t{state.width} * state.lines() * 2, 0);
    engine.compose(state, screen);
  }
  Colour pixel(u32 x, u32 y) const { return pixel_of(screen, state.width, x, y); }
  void window(unsigned number, Area area, u32 flags = ZV_WINDOW_ENABLED) {
    state.display.layout.window[number] = {number,       number,     1,          area.x_start,
                                           area.y_start, area.x_end, area.y_end, flags};
  }

  FrameQueue mpeg4{kCapacity}, mjpeg{kCapacity}, audio{kCapacity};
  Engine engine{mpeg4, mjpeg, audio};
  CardState state;
  std::int64_t next = 0;
  std::vector<u8> screen;
};

}  // namespace virtual_card

#endif
