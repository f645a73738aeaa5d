/**
 * @file screen.h
 * Draws over the preview picture: motion marks, grid, frames and zoom, on packed UYVY.
 */
#ifndef VIRTUAL_CARD_SCREEN_H
#define VIRTUAL_CARD_SCREEN_H

#include <vector>

#include "card_state.h"
#include "motion_detector.h"
#include "picture.h"

namespace virtual_card {

/// A UYVY picture. Does not own the memory.
struct Screen {
  u8 *uyvy;
  u32 width;
  u32 lines;

  u8 *line(u32 number) const { return uyvy + std::size_t{number} * width * 2; }
  void fill(Area area, Colour colour) const;
  /// Draws the four edges of an area, inside the area, two pixels and two lines thick.
  void outline(Area area, Colour colour) const;
};

/// Outlines the blocks with motion in an area that shows a picture of `width` x `lines`.
void draw_motion_marks(const Screen &screen, Area area, const MovedBlocks &blocks, u32 width, u32 lines);
/// Draws the borders of the ordinary windows of a layout.
void draw_grid(const Screen &screen, const driver::Grid &grid);
void draw_frame(const Screen &screen, const driver::FrameRect &frame);
/// Magnifies a part of half the width and height, at the origin of `zoom`, to the whole screen. `copy` is
/// scratch memory.
void magnify(const Screen &screen, const driver::Zoom &zoom, std::vector<u8> &copy);

}  // namespace virtual_card

#endif
