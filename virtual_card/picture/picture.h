/**
 * @file picture.h
 * A planar 4:2:2 picture with its fields interleaved line by line, and functions that draw into it.
 */
#ifndef VIRTUAL_CARD_PICTURE_H
#define VIRTUAL_CARD_PICTURE_H

#include <cstddef>
#include <vector>

#include "zv_type.h"

namespace virtual_card {

struct Colour {
  u8 y;
  u8 cb;
  u8 cr;
};

inline constexpr Colour kBlack{16, 128, 128};
inline constexpr Colour kWhite{235, 128, 128};
inline constexpr Colour kMaskGrey{80, 128, 128};
inline constexpr Colour kLostBlue{41, 240, 110};

/// Converts a colour: hue in degrees, saturation and value from 0 to 1.
Colour colour_from_hsv(double hue, double saturation, double value);

/// An area of a picture in pixels and lines; the end edges are exclusive.
struct Area {
  u32 x_start = 0;
  u32 y_start = 0;
  u32 x_end = 0;
  u32 y_end = 0;

  bool empty() const { return x_end <= x_start || y_end <= y_start; }
  bool operator==(const Area &) const = default;
};

/// The lines to paint: all lines, or the lines of one field.
struct Lines {
  u32 first;
  u32 step;

  u32 at_or_after(u32 line) const { return step == 1 || line % 2 == first ? line : line + 1; }
};
inline constexpr Lines kAllLines{0, 1};
/// Returns the lines of the field with this parity; 0 is the top field.
constexpr Lines field_lines(u32 parity) {
  return {parity, 2};
}

/// A resize or a copy changes the planes first and then the size: after a bad_alloc the planes are at least
/// as large as the size says.
struct Picture {
  std::vector<u8> y;   ///< width x lines
  std::vector<u8> cb;  ///< width / 2 x lines
  std::vector<u8> cr;
  u32 width = 0;
  u32 lines = 0;

  void resize(u32 new_width, u32 new_lines);
  u8 *y_line(u32 line) { return y.data() + std::size_t{line} * width; }
  u8 *cb_line(u32 line) { return cb.data() + std::size_t{line} * (width / 2); }
  u8 *cr_line(u32 line) { return cr.data() + std::size_t{line} * (width / 2); }
  const u8 *y_line(u32 line) const { return y.data() + std::size_t{line} * width; }
  const u8 *cb_line(u32 line) const { return cb.data() + std::size_t{line} * (width / 2); }
  const u8 *cr_line(u32 line) const { return cr.data() + std::size_t{line} * (width / 2); }
};

/// Returns the part of an area inside a picture of this size, with the x edges moved out to whole chroma
/// pixels.
Area clip(Area area, u32 width, u32 lines);

void fill(Picture &picture, Area area, Colour colour, Lines lines = kAllLines);
/// Copies an area from a picture of the same size.
void copy_area(Picture &to, const Picture &from, Area area, Lines lines = kAllLines);

/// A shape as coverage of each pixel, 0 to 255.
struct Coverage {
  u32 width = 0;
  u32 lines = 0;
  std::vector<u8> alpha;
};
Coverage disc(u32 diameter);
/// Paints a shape in one colour with its top left corner at (x, y); x must be even. Clips it to the picture.
void blend(Picture &picture, const Coverage &shape, u32 x, u32 y, Colour colour, Lines lines = kAllLines);

}  // namespace virtual_card

#endif
