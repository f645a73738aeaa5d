/**
 * @file zv_display.cpp
 * The preview picture: layouts, picture-in-picture and zoom.
 */
#include "zv_display.h"

#include <algorithm>
#include <cstdint>

#include "command.h"
#include "internal.h"
#include "zv_card.h"

namespace zarvo {

namespace {

constexpr u32 kLayouts = MUX_MODE_ZV_INVALID;
constexpr u32 kWindows = sizeof(ZV_DISPLAY::window) / sizeof(ZV_DISPLAY_WINDOW);

// By ZV_VIDEO_MODE: the number of windows shown, of grid columns and rows, and the scale code of an ordinary
// window.
constexpr u32 disp_nr_channel[kLayouts] = {1, 4, 6, 8, 9, 16};
constexpr u32 disp_div[kLayouts] = {1, 2, 3, 4, 3, 4};
constexpr u32 disp_scale[kLayouts] = {1, 3, 4, 5, 4, 5};

constexpr u32 kHidden = 0;    ///< scale code of a window that is not shown
constexpr u32 kPipScale = 4;  ///< scale code of the picture-in-picture, a third of the display wide and high

/// A layout whose window 0 is larger: its side in grid cells, its scale code, and the cells of the other
/// windows.
struct LargeWindow {
  u32 cells;
  u32 scale;
  u32 others[7];
};
constexpr LargeWindow kLargeOf6{2, 6, {2, 5, 6, 7, 8}};
constexpr LargeWindow kLargeOf8{3, 7, {3, 7, 11, 12, 13, 14, 15}};

const LargeWindow *large_window(u32 mode) {
  switch (mode) {
    case MUX_MODE_ZV_6CH:
      return &kLargeOf6;
    case MUX_MODE_ZV_8CH:
      return &kLargeOf8;
    default:
      return nullptr;
  }
}

constexpr u32 kGridStride = 4;  ///< bits from one row to the next in the cell mask, in every layout
constexpr u32 kEdge = 2;        ///< distance of the last borders and the screen frame from the edge

constexpr u32 multiple_of_8(u32 value) {
  return value & ~7u;
}

struct Size {
  u32 width;
  u32 height;
};

Size cell_size(const ZV_DISPLAY &display, u32 div) {
  return {multiple_of_8(display.width / div), multiple_of_8(display.height / div)};
}

void place(ZV_DISPLAY_WINDOW &window, u32 scale, u32 x, u32 y, Size size) {
  window.scale = scale;
  window.x_start = x;
  window.y_start = y;
  window.x_end = x + size.width;
  window.y_end = y + size.height;
}

int send_window(const ZV_DISPLAY &display, ZV_DISPLAY_WINDOW &window) {
  return issue(display.fd, driver::DISP_IOC_SET_WINDOW, window);
}

int send_frame(const ZV_DISPLAY &display, u32 number, const ZV_DISPLAY_WINDOW &window) {
  return issue(display.fd, driver::DISP_IOC_SET_RECT,
               driver::FrameRect{number, window.x_start, window.y_start, window.x_end, window.y_end, 1, 0});
}

/// The layout must not change while zoom or picture-in-picture is on.
bool frozen(const ZV_DISPLAY &display) {
  return display.zoom != 0 || display.pip != nullptr;
}

driver::Grid even_grid(const ZV_DISPLAY &display, u32 div) {
  const Size cell = cell_size(display, div);
  driver::Grid grid{};
  for (u32 i = 0; i < div; ++i) {
    grid.column[i] = i * cell.width;
    grid.row[i] = i * cell.height;
  }
  grid.column[div] = display.width - kEdge;
  grid.row[div] = display.height - kEdge;
  return grid;
}

/// Places window `i` in the layout and sets its bit in the cell mask.
void lay_out(ZV_DISPLAY &display, u32 mode, u32 i, driver::Grid &grid) {
  ZV_DISPLAY_WINDOW &window = display.window[i];
  if (i >= disp_nr_channel[mode]) return place(window, kHidden, 0, 0, {0, 0});
  const u32 div = disp_div[mode];
  const Size cell = cell_size(display, div);
  const LargeWindow *large = large_window(mode);
  if (large != nullptr && i == 0)
    return place(window, large->scale, 0, 0, {large->cells * cell.width, large->cells * cell.height});
  const u32 number = large != nullptr ? large->others[i - 1] : i;
  const u32 column = number % div;
  const u32 row = number / div;
  place(window, disp_scale[mode], column * cell.width, row * cell.height, cell);
  grid.cells |= 1u << (row * kGridStride + column);
}

constexpr u32 kPlainSource[driver::kSourceGroups] = {0x00000000, 0x10000000, 0x20000000, 0x30000000};
/// Source words for a three-column layout when the display is as wide as the input.
constexpr u32 kThirdSource[driver::kSourceGroups] = {0x00001000, 0x10001002, 0x200012BA, 0x300012BC};

void send_source(const ZV_DISPLAY &display, const u32 (&words)[driver::kSourceGroups]) {
  for (u32 word : words) issue(display.fd, driver::DISP_IOC_SET_SOURCE_CFG, word);
}

void finish_update(const ZV_DISPLAY &display, driver::Grid &grid) {
  issue(display.fd, driver::DISP_IOC_SET_GRID, grid);
  issue(display.fd, driver::DISP_IOC_END_UPDATE);
}

/// Clamps to 0 ... limit. The value has 64 bits so that any edge plus any int fits.
u32 clamped(std::int64_t value, u32 limit) {
  return static_cast<u32>(std::clamp<std::int64_t>(value, 0, limit));
}

/// Shows a window as picture-in-picture at (x, y), clamped so that it fits on the display.
int show_pip(const ZV_DISPLAY &display, ZV_DISPLAY_WINDOW &window, std::int64_t x, std::int64_t y) {
  const Size size = cell_size(display, 3);
  place(window, kPipScale, multiple_of_8(clamped(x, display.width - size.width)),
        multiple_of_8(clamped(y, display.height - size.height)), size);
  send_window(display, window);
  return send_frame(display, driver::kPipFrame, window);
}

int hide_pip(ZV_DISPLAY &display) {
  if (display.pip == nullptr) return -1;
  ZV_DISPLAY_WINDOW &window = *display.pip;
  window.flags &= ~ZV_WINDOW_PIP;
  place(window, kHidden, window.x_start, window.y_start, {0, 0});
  send_window(display, window);
  issue(display.fd, driver::DISP_IOC_SET_RECT, driver::FrameRect{driver::kPipFrame, 0, 0, 0, 0, 0, 0});
  display.pip = nullptr;
  return 0;
}

}  // namespace

ZV_DISPLAY *open_display(ZV_CARD &card, u32 mode) {
  if (mode >= kLayouts) return nullptr;
  ZV_DISPLAY &display = card.display;
  const u32 width = ask(display.fd, driver::DISP_IOC_GET_WIDTH);
  const u32 height = ask(display.fd, driver::DISP_IOC_GET_HEIGHT) * 2;
  issue(display.fd, driver::DISP_IOC_SET_RECT,
        driver::FrameRect{driver::kScreenFrame, 0, 0, width - kEdge, height - kEdge, 1, 0});
  display.width = width;
  display.height = height;
  display.mode = mode;
  zv_display_zoom(&display, 0, 0, 0);
  zv_display_mux_mode(&display, mode, card.resolution);
  return &display;
}

}  // namespace zarvo

using namespace zarvo;

ZV_DISPLAY *zv_display_open(HANDLE handle, u32 mode) {
  return value_from(handle, nullptr, open_display, mode);
}

void zv_display_close(ZV_DISPLAY *) {}

int zv_display_mux_mode(ZV_DISPLAY *display, u32 mode, u32 resolution) {
  if (display == nullptr || mode >= kLayouts || frozen(*display)) return -1;
  issue(display->fd, driver::DISP_IOC_BEGIN_UPDATE);
  driver::Grid grid = even_grid(*display, disp_div[mode]);
  for (u32 i = 0; i < kWindows; ++i) {
    lay_out(*display, mode, i, grid);
    send_window(*display, display->window[i]);
  }
  if (disp_div[mode] == 3 && display->width == input_width(resolution)) {
    send_source(*display, kThirdSource);
    grid.column[1] += 4;
    grid.column[2] += 4;
  } else {
    send_source(*display, kPlainSource);
  }
  finish_update(*display, grid);
  display->mode = mode;
  return 0;
}

int zv_display_select_channel(ZV_DISPLAY *display, u32 channel) {
  if (display == nullptr || frozen(*display)) return -1;
  issue(display->fd, driver::DISP_IOC_BEGIN_UPDATE);
  driver::Grid grid = even_grid(*display, 1);
  for (ZV_DISPLAY_WINDOW &window : display->window) {
    if (window.channel == channel) {
      place(window, disp_scale[MUX_MODE_ZV_1CH], 0, 0, {display->width, display->height});
      grid.cells |= 1;
    } else {
      place(window, kHidden, 0, 0, {0, 0});
    }
    send_window(*display, window);
  }
  send_source(*display, kPlainSource);
  finish_update(*display, grid);
  display->mode = MUX_MODE_ZV_1CH;
  return 0;
}

int zv_display_channel_mode(ZV_DISPLAY *display, u32 window, u32 flags) {
  if (display == nullptr || window >= kWindows) return -1;
  display->window[window].flags = flags;
  return send_window(*display, display->window[window]);
}

int zv_display_pos2channel(ZV_DISPLAY *display, u32 x, u32 y) {
  if (display == nullptr) return -1;
  if (display->pip != nullptr) return static_cast<int>(display->pip->channel);
  for (const ZV_DISPLAY_WINDOW &window : display->window)
    if (window.x_start <= x && x < window.x_end && window.y_start <= y && y < window.y_end)
      return static_cast<int>(window.channel);
  return -1;
}

int zv_display_motion_trace(ZV_DISPLAY *display, u32 on) {
  if (display == nullptr) return -1;
  return issue(display->fd, on != 0 ? driver::DISP_IOC_MOTION_TRACE_ON : driver::DISP_IOC_MOTION_TRACE_OFF);
}

int zv_display_zoom(ZV_DISPLAY *display, u32 level, int x, int y) {
  if (display == nullptr || display->mode != MUX_MODE_ZV_1CH || display->pip != nullptr) return -1;
  const int result =
      issue(display->fd, driver::DISP_IOC_SET_ZOOM,
            driver::Zoom{level, clamped(x, display->width / 2), clamped(y, display->height / 2)});
  if (result == 0) display->zoom = level;
  return result;
}

int zv_display_pip(ZV_DISPLAY *display, int channel, u32 x, u32 y) {
  if (display == nullptr || display->mode != MUX_MODE_ZV_1CH || display->zoom != 0) return -1;
  if (channel == -1) return hide_pip(*display);
  const auto end = std::end(display->window);
  const auto window = std::find_if(std::begin(display->window), end, [channel](const auto &entry) {
    return entry.channel == static_cast<u32>(channel);
  });
  if (window == end || window->scale != kHidden) return -1;
  window->flags |= ZV_WINDOW_PIP;
  show_pip(*display, *window, x, y);
  display->pip = window;
  return 0;
}

int zv_display_pip_move(ZV_DISPLAY *display, int dx, int dy) {
  if (display == nullptr || display->pip == nullptr) return -1;
  ZV_DISPLAY_WINDOW &window = *display->pip;
  return show_pip(*display, window, std::int64_t{window.x_start} + dx, std::int64_t{window.y_start} + dy);
}
