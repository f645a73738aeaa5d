// Composes the preview picture.
#include "compositor.h"

#include <algorithm>

#include "screen.h"

namespace virtual_card {

namespace {

constexpr unsigned kOne = 256;  ///< 1.0 in the fixed-point weights of blends

std::uint64_t size_of(const ZV_DISPLAY_WINDOW &window) {
  return std::uint64_t{window.x_end - window.x_start} * (window.y_end - window.y_start);
}

/// Returns whether window `a` is drawn before window `b`: windows without ZV_WINDOW_PIP first, then large
/// before small, so that a picture-in-picture window whose flag was cleared stays visible.
bool below(const ZV_DISPLAY_WINDOW *a, const ZV_DISPLAY_WINDOW *b) {
  const auto mark = [](const ZV_DISPLAY_WINDOW *window) { return window->flags & ZV_WINDOW_PIP; };
  return mark(a) != mark(b) ? mark(a) < mark(b) : size_of(*a) > size_of(*b);
}

}  // namespace

std::vector<View> views(const CardState &state) {
  const DisplayState &display = state.display;
  std::vector<const ZV_DISPLAY_WINDOW *> shown;
  for (const ZV_DISPLAY_WINDOW &window : display.layout.window)
    if (window.scale != 0) shown.push_back(&window);
  std::stable_sort(shown.begin(), shown.end(), below);

  std::vector<View> result;
  for (const ZV_DISPLAY_WINDOW *window : shown) {
    const Area area =
        clip({window->x_start, window->y_start, window->x_end, window->y_end}, state.width, state.lines());
    if (area.empty()) continue;
    // A disabled window is black, also where it covers another window.
    const bool on = (window->flags & ZV_WINDOW_ENABLED) != 0;
    const auto number = static_cast<std::size_t>(window - display.layout.window.data());
    result.push_back({on ? display.routing[number] % kChannels : kChannels, area,
                      (area.y_end - area.y_start) * 2 > state.lines()});
  }
  return result;
}

void Compositor::PlaneScaler::prepare(u32 in_width, u32 out_width) {
  if (in_width == in_width_ && out_width == out_width_) return;
  in_width_ = 0;  // after a bad_alloc the next call starts again
  for (auto &buffer : buffer_) buffer.resize(in_width);
  taps_.resize(out_width);
  in_width_ = in_width;
  out_width_ = out_width;
  halved_width_ = in_width;
  while (halved_width_ >= 2 * out_width_ && halved_width_ % 2 == 0) halved_width_ /= 2;
  for (u32 i = 0; i < out_width; ++i) {
    const u32 at = std::min(i * halved_width_ * kOne / out_width, (halved_width_ - 1) * kOne);
    const u32 first = at / kOne;
    taps_[i] = {static_cast<u16>(first), static_cast<u16>(std::min(first + 1, halved_width_ - 1)),
                static_cast<u16>(at % kOne)};
  }
}

const u8 *Compositor::PlaneScaler::row(const u8 *first, const u8 *second, unsigned weight) {
  const u8 *in = first;
  unsigned turn = 0;
  const auto next = [&] { return buffer_[turn++ % 2].data(); };
  if (weight != 0) {
    u8 *const out = next();
    blend_rows(first, second, weight, out, in_width_);
    in = out;
  }
  for (u32 width = in_width_; width > halved_width_; width /= 2) {
    u8 *const out = next();
    halve_row(in, out, width / 2);
    in = out;
  }
  if (halved_width_ != out_width_) {
    u8 *const out = next();
    resample_row(in, taps_.data(), out, out_width_);
    in = out;
  }
  return in;
}

void Compositor::paint(const View &view, const Picture &picture) {
  const u32 width = view.area.x_end - view.area.x_start;
  const u32 lines = view.area.y_end - view.area.y_start;
  // A window with both fields uses all lines, any other only the lines of the top field.
  const u32 step = view.both_fields ? 1 : 2;
  const u32 source_lines = picture.lines / step;
  luma_.prepare(picture.width, width);
  cb_.prepare(picture.width / 2, width / 2);
  cr_.prepare(picture.width / 2, width / 2);
  for (u32 line = 0; line < lines; ++line) {
    const u32 at = line * source_lines * kOne / lines;
    const u32 first = at / kOne * step;
    const u32 second = std::min(at / kOne + 1, source_lines - 1) * step;
    // When scaling down to half or less, mix two lines in equal parts.
    const unsigned weight = source_lines >= 2 * lines ? kOne / 2 : at % kOne;
    const u8 *const y = luma_.row(picture.y_line(first), picture.y_line(second), weight);
    const u8 *const cb = cb_.row(picture.cb_line(first), picture.cb_line(second), weight);
    const u8 *const cr = cr_.row(picture.cr_line(first), picture.cr_line(second), weight);
    u8 *const out = screen_ + (std::size_t{view.area.y_start + line} * width_ + view.area.x_start) * 2;
    pack_uyvy(y, cb, cr, out, width / 2);
  }
}

void Compositor::compose(const CardState &state, std::span<const View> windows,
                         const std::array<ViewSource, kChannels> &sources, std::span<u8> uyvy) {
  width_ = state.width;
  lines_ = state.lines();
  if (uyvy.size() < std::size_t{width_} * lines_ * 2) return;
  screen_ = uyvy.data();
  const Screen screen{screen_, width_, lines_};
  screen.fill({0, 0, width_, lines_}, kBlack);
  for (const View &view : windows) {
    const Picture *const picture = view.channel < kChannels ? sources[view.channel].picture : nullptr;
    if (picture == nullptr) {
      screen.fill(view.area, kBlack);
      continue;
    }
    paint(view, *picture);
    const MovedBlocks *const marks = sources[view.channel].marks;
    if (marks != nullptr) draw_motion_marks(screen, view.area, *marks, picture->width, picture->lines);
  }
  if (state.display.layout.zoom.level != 0) magnify(screen, state.display.layout.zoom, unzoomed_);
  draw_grid(screen, state.display.layout.grid);
  for (const driver::FrameRect &frame : state.display.layout.frame) draw_frame(screen, frame);
}

}  // namespace virtual_card
