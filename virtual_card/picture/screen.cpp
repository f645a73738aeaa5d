// Draws lines and boxes on the preview picture.
#include "screen.h"

#include <algorithm>
#include <cstring>

#include "pixel_ops.h"

namespace virtual_card {

namespace {

constexpr u32 kThick = 2;
constexpr u32 kGridSide = 4;
constexpr Colour kGridColour{110, 128, 128};
constexpr Colour kFrameColour{190, 128, 128};
constexpr Colour kMarkColour{106, 100, 212};

}  // namespace

void Screen::fill(Area area, Colour colour) const {
  area = clip(area, width, lines);
  const u8 pair[] = {colour.cb, colour.y, colour.cr, colour.y};
  for (u32 y = area.y_start; y < area.y_end; ++y) {
    u8 *const row = line(y);
    for (u32 x = area.x_start; x < area.x_end; x += 2)
      std::memcpy(row + std::size_t{x} * 2, pair, sizeof(pair));
  }
}

void Screen::outline(Area area, Colour colour) const {
  const auto [left, top, right, bottom] = area;
  if (right < left + kThick || bottom < top + kThick) return;
  fill({left, top, right, top + kThick}, colour);
  fill({left, bottom - kThick, right, bottom}, colour);
  fill({left, top, left + kThick, bottom}, colour);
  fill({right - kThick, top, right, bottom}, colour);
}

void draw_motion_marks(const Screen &screen, Area area, const MovedBlocks &blocks, u32 width, u32 lines) {
  const u32 view_width = area.x_end - area.x_start, view_lines = area.y_end - area.y_start;
  const auto x_of = [&](u32 column) {
    return area.x_start + column * driver::kMotionBlock * view_width / width;
  };
  const auto y_of = [&](u32 row) { return area.y_start + row * driver::kMotionBlock * view_lines / lines; };
  for (u32 row = 0; row < blocks.rows; ++row) {
    for (u32 column = 0; column < blocks.columns; ++column) {
      if (!blocks.at(column, row)) continue;
      // Draw an edge only towards a block without motion: neighbouring blocks share one outline.
      const u32 left = x_of(column), right = x_of(column + 1), top = y_of(row), bottom = y_of(row + 1);
      if (column == 0 || !blocks.at(column - 1, row)) screen.fill({left, top, left + 2, bottom}, kMarkColour);
      if (!blocks.at(column + 1, row)) screen.fill({right - 2, top, right, bottom}, kMarkColour);
      if (row == 0 || !blocks.at(column, row - 1)) screen.fill({left, top, right, top + 1}, kMarkColour);
      if (!blocks.at(column, row + 1)) screen.fill({left, bottom - 1, right, bottom}, kMarkColour);
    }
  }
}

void draw_grid(const Screen &screen, const driver::Grid &grid) {
  // Neighbouring cells share a border: the right and bottom borders of a cell start on its end edges, where
  // the next cells have their left and top borders.
  for (u32 row = 0; row < kGridSide; ++row) {
    for (u32 column = 0; column < kGridSide; ++column) {
      if (((grid.cells >> (row * kGridSide + column)) & 1) == 0) continue;
      const u32 left = grid.column[column], right = grid.column[column + 1];
      const u32 top = grid.row[row], bottom = grid.row[row + 1];
      if (right <= left || bottom <= top) continue;
      screen.fill({left, top, right, top + kThick}, kGridColour);
      screen.fill({left, bottom, right, bottom + kThick}, kGridColour);
      screen.fill({left, top, left + kThick, bottom + kThick}, kGridColour);
      screen.fill({right, top, right + kThick, bottom + kThick}, kGridColour);
    }
  }
}

void draw_frame(const Screen &screen, const driver::FrameRect &frame) {
  if (frame.enable == 0) return;
  // The end edges of the screen frame are the start of its last border, those of a window frame are
  // exclusive.
  const u32 beyond = frame.number == driver::kScreenFrame ? kThick : 0;
  const u32 right = std::min(frame.x_end, screen.width), bottom = std::min(frame.y_end, screen.lines);
  screen.outline({frame.x_start, frame.y_start, right + beyond, bottom + beyond}, kFrameColour);
}

void magnify(const Screen &screen, const driver::Zoom &zoom, std::vector<u8> &copy) {
  const std::size_t row_bytes = std::size_t{screen.width} * 2;
  const u32 half_width = screen.width / 2 & ~1u, half_lines = screen.lines / 2;
  const u32 left = std::min(zoom.x, screen.width - half_width) & ~1u;
  const u32 top = std::min(zoom.y, screen.lines - half_lines);
  copy.resize(row_bytes * half_lines);
  for (u32 y = 0; y < half_lines; ++y) {
    const u8 *const in = screen.line(top + y) + std::size_t{left} * 2;
    u8 *const out = copy.data() + y * row_bytes;
    for (u32 x = 0; x < half_width; ++x) {
      const u8 *const pair = in + std::size_t{x / 2} * 4;
      const u8 *const next = x + 2 < half_width ? in + std::size_t{(x + 1) / 2} * 4 : pair;
      const u8 here = pair[1 + x % 2 * 2], there = next[1 + (x + 1) % 2 * 2];
      u8 *const to = out + std::size_t{x} * 4;
      to[0] = pair[0];
      to[1] = here;
      to[2] = pair[2];
      to[3] = static_cast<u8>((here + there + 1) / 2);
    }
  }
  for (u32 y = 0; y < screen.lines; ++y) {
    const u32 source = std::min(y / 2, half_lines - 1);
    const u32 other = y % 2 == 0 ? source : std::min(source + 1, half_lines - 1);
    average_rows(copy.data() + source * row_bytes, copy.data() + other * row_bytes, screen.line(y),
                 row_bytes);
  }
}

}  // namespace virtual_card
