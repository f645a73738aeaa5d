// Commands of the display node, and preview reads.
#include "device_display.h"

#include <sys/mman.h>

#include <cerrno>
#include <cstring>
#include <tuple>

#include "host/user_memory.h"

namespace virtual_card {
namespace {

constexpr CommandRow kCommands[] = {
    VIRTUAL_CARD_COMMAND(DisplayDevice::begin_update, DISP_IOC_BEGIN_UPDATE),
    VIRTUAL_CARD_COMMAND(DisplayDevice::end_update, DISP_IOC_END_UPDATE),
    VIRTUAL_CARD_COMMAND(DisplayDevice::set_window, DISP_IOC_SET_WINDOW),
    VIRTUAL_CARD_COMMAND(DisplayDevice::set_zoom, DISP_IOC_SET_ZOOM),
    VIRTUAL_CARD_COMMAND(DisplayDevice::set_source, DISP_IOC_SET_SOURCE_CFG),
    VIRTUAL_CARD_COMMAND(DisplayDevice::set_grid, DISP_IOC_SET_GRID),
    VIRTUAL_CARD_COMMAND(DisplayDevice::set_rect, DISP_IOC_SET_RECT),
    VIRTUAL_CARD_COMMAND(DisplayDevice::trace_on, DISP_IOC_MOTION_TRACE_ON),
    VIRTUAL_CARD_COMMAND(DisplayDevice::trace_off, DISP_IOC_MOTION_TRACE_OFF),
    VIRTUAL_CARD_COMMAND(DisplayDevice::get_width, DISP_IOC_GET_WIDTH, First::word, Answer::yes),
    VIRTUAL_CARD_COMMAND(DisplayDevice::get_height, DISP_IOC_GET_HEIGHT, First::word, Answer::yes),
    VIRTUAL_CARD_COMMAND(DisplayDevice::set_standard, DISP_IOC_SET_STANDARD),
    VIRTUAL_CARD_COMMAND(DisplayDevice::read_register, DISP_IOC_READ_REG, First::word, Answer::yes),
    VIRTUAL_CARD_COMMAND(DisplayDevice::write_register, DISP_IOC_WRITE_REG),
    VIRTUAL_CARD_COMMAND(DisplayDevice::preview_on, DISP_IOC_PREVIEW_ON),
    VIRTUAL_CARD_COMMAND(DisplayDevice::preview_off, DISP_IOC_PREVIEW_OFF),
    VIRTUAL_CARD_COMMAND(DisplayDevice::get_motion, DISP_IOC_GET_MOTION, First::word, Answer::yes),
    VIRTUAL_CARD_COMMAND(DisplayDevice::select_buffer, DISP_IOC_SELECT_BUFFER),
};

}  // namespace

std::span<const CommandRow> DisplayDevice::table() {
  return kCommands;
}

Layout &DisplayDevice::layout() {
  return board_.settings.batching ? board_.settings.batch : board_.settings.state.display.layout;
}

bool DisplayDevice::pass_faults(u32 &index, long &result) {
  if (board_.preview_faults.stalled()) return false;
  Passing passing{StreamKind::preview, {std::vector<u8>(sizeof index), result}};
  std::memcpy(passing.frame.area.data(), &index, sizeof index);
  board_.preview_faults.change(passing);
  std::memcpy(&index, passing.frame.area.data(), sizeof index);
  result = passing.frame.result;
  return true;
}

long DisplayDevice::read(std::uintptr_t buffer, std::size_t count) {
  u32 index = 0;
  if (count < sizeof index) return -EINVAL;
  const std::lock_guard lock(board_.mutex);
  long result = 0;
  auto &scripted = board_.settings.scripted_previews;
  if (!scripted.empty()) {
    std::tie(index, result) = scripted.front();
  } else {
    if (!board_.preview.newest) return 0;
    index = *board_.preview.newest;
    result = board_.preview.size;
  }
  if (board_.preview_faults.any() && !pass_faults(index, result)) return 0;
  if (const long error = copy_to_user(buffer, &index, sizeof index)) return error;
  if (scripted.empty())
    board_.preview.handed = board_.preview.newest;
  else
    scripted.pop_front();
  return result;
}

long DisplayDevice::place_mapping(std::size_t length, int protection, off_t offset) {
  if ((protection & PROT_WRITE) != 0) return -EACCES;
  if (offset != 0 || length > driver::kPreviewBufferSize) return -EINVAL;
  const std::lock_guard lock(board_.mutex);
  return static_cast<long>(board_.settings.selected_buffer * driver::kPreviewBufferSize);
}

long DisplayDevice::begin_update() {
  board_.settings.batch = board_.settings.state.display.layout;
  board_.settings.batching = true;
  return 0;
}

long DisplayDevice::end_update() {
  if (!board_.settings.batching) return 0;
  board_.settings.batching = false;
  board_.settings.state.display.layout = board_.settings.batch;
  return 0;
}

long DisplayDevice::set_window(ZV_DISPLAY_WINDOW &window) {
  if (window.index >= layout().window.size() || window.channel >= kChannels) return -EINVAL;
  if (window.x_end < window.x_start || window.y_end < window.y_start) return -EINVAL;
  layout().window[window.index] = window;
  return 0;
}

long DisplayDevice::set_zoom(driver::Zoom &zoom) {
  layout().zoom = zoom;
  return 0;
}

/// Checks the word and ignores it. On a real card it adjusts the scaler for a three-column layout; the drawn
/// pictures do not need that.
long DisplayDevice::set_source(u32 &word) {
  return word >> driver::kSourceGroupShift < driver::kSourceGroups ? 0 : -EINVAL;
}

long DisplayDevice::set_grid(driver::Grid &grid) {
  layout().grid = grid;
  return 0;
}

long DisplayDevice::set_rect(driver::FrameRect &rect) {
  if (rect.number >= layout().frame.size()) return -EINVAL;
  layout().frame[rect.number] = rect;
  return 0;
}

long DisplayDevice::trace_on() {
  board_.settings.state.display.motion_trace = true;
  return 0;
}

long DisplayDevice::trace_off() {
  board_.settings.state.display.motion_trace = false;
  return 0;
}

long DisplayDevice::get_width(u32 &width) {
  width = board_.settings.state.width;
  return 0;
}

long DisplayDevice::get_height(u32 &height) {
  height = board_.settings.state.lines() / 2;
  return 0;
}

long DisplayDevice::set_standard(u32 &standard) {
  return board_.set_standard(standard);
}

long DisplayDevice::read_register(driver::Register &record) {
  record.value = board_.read_register(board_.settings.codec, record.address);
  return 0;
}

long DisplayDevice::write_register(driver::Register &record) {
  board_.write_codec(record.address, record.value);
  return 0;
}

long DisplayDevice::preview_on() {
  board_.settings.state.display.on = true;
  return 0;
}

long DisplayDevice::preview_off() {
  board_.settings.state.display.on = false;
  board_.preview.newest.reset();  // the next preview must not start with an old picture
  return 0;
}

long DisplayDevice::get_motion(u32 &bits) {
  bits = board_.settings.scripted_motion.value_or(board_.engine.motion());
  return 0;
}

long DisplayDevice::select_buffer(u32 &index) {
  if (index >= driver::kPreviewBuffers) return -EINVAL;
  board_.settings.selected_buffer = index;
  return 0;
}

}  // namespace virtual_card
