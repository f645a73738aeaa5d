// Planar pictures and the drawing functions.
#include "picture.h"

#include <algorithm>
#include <cmath>
#include <cstring>

namespace virtual_card {

namespace {

u8 to_byte(double value) {
  return static_cast<u8>(std::lround(std::clamp(value, 0.0, 255.0)));
}

u8 mix(u8 under, u8 over, u32 alpha) {
  return static_cast<u8>((under * (255 - alpha) + over * alpha + 127) / 255);
}

}  // namespace

Colour colour_from_hsv(double hue, double saturation, double value) {
  const auto channel = [&](double shift) {
    const double k = std::fmod(shift + hue / 60.0, 6.0);
    return value - value * saturation * std::max(0.0, std::min({k, 4.0 - k, 1.0}));
  };
  const double r = channel(5), g = channel(3), b = channel(1);
  return {to_byte(16 + 65.481 * r + 128.553 * g + 24.966 * b),
          to_byte(128 - 37.797 * r - 74.203 * g + 112.0 * b),
          to_byte(128 + 112.0 * r - 93.786 * g - 18.214 * b)};
}

void Picture::resize(u32 new_width, u32 new_lines) {
  const std::size_t pixels = std::size_t{new_width} * new_lines;
  y.assign(pixels, kBlack.y);
  cb.assign(pixels / 2, kBlack.cb);
  cr.assign(pixels / 2, kBlack.cr);
  width = new_width;
  lines = new_lines;
}

Area clip(Area area, u32 width, u32 lines) {
  area.x_end = std::min(area.x_end, width);
  area.y_end = std::min(area.y_end, lines);
  if (area.empty()) return {};
  return {area.x_start & ~1u, area.y_start, std::min((area.x_end + 1) & ~1u, width), area.y_end};
}

void fill(Picture &picture, Area area, Colour colour, Lines lines) {
  area = clip(area, picture.width, picture.lines);
  const u32 pixels = area.x_end - area.x_start;
  for (u32 line = lines.at_or_after(area.y_start); line < area.y_end; line += lines.step) {
    std::memset(picture.y_line(line) + area.x_start, colour.y, pixels);
    std::memset(picture.cb_line(line) + area.x_start / 2, colour.cb, pixels / 2);
    std::memset(picture.cr_line(line) + area.x_start / 2, colour.cr, pixels / 2);
  }
}

void copy_area(Picture &to, const Picture &from, Area area, Lines lines) {
  area = clip(area, to.width, to.lines);
  const u32 pixels = area.x_end - area.x_start;
  const u32 x = area.x_start;
  for (u32 line = lines.at_or_after(area.y_start); line < area.y_end; line += lines.step) {
    std::memcpy(to.y_line(line) + x, from.y_line(line) + x, pixels);
    std::memcpy(to.cb_line(line) + x / 2, from.cb_line(line) + x / 2, pixels / 2);
    std::memcpy(to.cr_line(line) + x / 2, from.cr_line(line) + x / 2, pixels / 2);
  }
}

Coverage disc(u32 diameter) {
  Coverage shape{diameter, diameter, std::vector<u8>(std::size_t{diameter} * diameter)};
  const double radius = diameter / 2.0;
  for (u32 line = 0; line < diameter; ++line) {
    for (u32 x = 0; x < diameter; ++x) {
      const double distance = std::hypot(x + 0.5 - radius, line + 0.5 - radius);
      shape.alpha[std::size_t{line} * diameter + x] = to_byte((radius - distance) * 255.0);
    }
  }
  return shape;
}

void blend(Picture &picture, const Coverage &shape, u32 x, u32 y, Colour colour, Lines lines) {
  const Area area = clip({x, y, x + shape.width, y + shape.lines}, picture.width, picture.lines);
  for (u32 line = lines.at_or_after(area.y_start); line < area.y_end; line += lines.step) {
    const u8 *alpha = shape.alpha.data() + std::size_t{line - y} * shape.width;
    u8 *const luma = picture.y_line(line) + area.x_start;
    u8 *const cb = picture.cb_line(line) + area.x_start / 2;
    u8 *const cr = picture.cr_line(line) + area.x_start / 2;
    const u32 pixels = std::min(shape.width, area.x_end - area.x_start);
    for (u32 i = 0; i < pixels; ++i) {
      if (alpha[i] == 0) continue;
      luma[i] = mix(luma[i], colour.y, alpha[i]);
      if (i % 2 == 0) {
        cb[i / 2] = mix(cb[i / 2], colour.cb, alpha[i]);
        cr[i / 2] = mix(cr[i / 2], colour.cr, alpha[i]);
      }
    }
  }
}

}  // namespace virtual_card
