/**
 * @file device_display.h
 * The display node.
 */
#ifndef VIRTUAL_CARD_DEVICE_DISPLAY_H
#define VIRTUAL_CARD_DEVICE_DISPLAY_H

#include "device.h"

namespace virtual_card {

/// /dev/zarvo_disp0: layout, codec registers, motion bits and preview pictures.
class DisplayDevice : public DeviceNode {
 public:
  explicit DisplayDevice(Board &board) : DeviceNode(board, Device::display, board.preview_region) {}

  long read(std::uintptr_t buffer, std::size_t count) override;
  long place_mapping(std::size_t length, int protection, off_t offset) override;

  long begin_update();
  long end_update();
  long set_window(ZV_DISPLAY_WINDOW &window);
  long set_zoom(driver::Zoom &zoom);
  long set_source(u32 &word);
  long set_grid(driver::Grid &grid);
  long set_rect(driver::FrameRect &rect);
  long trace_on();
  long trace_off();
  long get_width(u32 &width);
  long get_height(u32 &height);
  long set_standard(u32 &standard);
  long read_register(driver::Register &record);
  long write_register(driver::Register &record);
  long preview_on();
  long preview_off();
  long get_motion(u32 &bits);
  long select_buffer(u32 &index);

  static std::span<const CommandRow> table();

 private:
  /// Applies the preview faults to the index and the result of a read. Returns false when the read finds no
  /// picture.
  bool pass_faults(u32 &index, long &result);
  /// Returns the layout that layout commands change: the batch between begin and end of an update, else the
  /// layout that is shown.
  Layout &layout();
};

}  // namespace virtual_card

#endif
