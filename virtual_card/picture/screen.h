/**
 * @file screen.h
 * What is painted over the preview picture: lines and boxes on packed 4:2:2.
 */
#ifndef VIRTUAL_CARD_SCREEN_H
#define VIRTUAL_CARD_SCREEN_H

#include <vector>

#include "card_state.h"
#include "motion_detector.h"
#include "picture.h"

namespace virtual_card {

/// A UYVY picture somebody else owns.
struct Screen {
  u8 *uyvy;
  u32 width;
  u32 lines;

  u8 *line(u32 number) const { return uyvy + std::size_t{number} * width * 2; }
  void fill(Area area, Colour colour) const;
  /// The four edges of an area, inside it, two pixels and two lines thick.
  void outline(Area area, Colour colour) const;
};

/// Outlines the blocks with motion in the area that shows a picture of this size.
void draw_motion_marks(const Screen &screen, Area area, const MovedBlocks &blocks, u32 width, u32 lines);
/// Lines between the ordinary windows of a layout.
void draw_grid(const Screen &screen, const driver::Grid &grid);
void draw_frame(const Screen &screen, const driver::FrameRect &frame);
/// Magnifies the part of half width and height at the zoom's origin to the whole screen. `copy` is
/// the memory it works in.
void magnify(const Screen &screen, const driver::Zoom &zoom, std::vector<u8> &copy);

}  // namespace virtual_card

#endif
