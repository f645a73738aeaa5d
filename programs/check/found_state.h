/**
 * @file found_state.h
 * What the card had before the checks, as far as the driver tells it, and how to put it back.
 *
 * The driver tells no layout. It is found again in the preview picture: the borders of the windows stand
 * where only one of the six layouts has them. The driver does not tell bit rates, quantiser ranges, channel
 * numbers, zoom, picture-in-picture and parts of motion maps either: they end as the SDK leaves them when it
 * stops.
 */
#ifndef CONTRACT_FOUND_STATE_H
#define CONTRACT_FOUND_STATE_H

#include <functional>
#include <optional>

#include "driver_nodes.h"
#include "image.h"
#include "zv_lib.h"

namespace contract {

class FoundState {
 public:
  explicit FoundState(Nodes &nodes);

  /// Puts the layout back. Call it before restore(), which closes the preview.
  void restore_layout(HANDLE card) const;
  /// Puts everything else back.
  void restore(const Nodes &nodes) const;

 private:
  void note_registers(const Nodes &nodes);
  void note_encoders(const Nodes &nodes);
  void note_motion_levels(const Nodes &nodes);
  void clear_layout(const Nodes &nodes) const;

  u32 standard_ = VIDEO_STANDARD_ZV_NTSC;
  u32 resolution_ = RESOLUTION_ZV_720;
  std::array<u32, ZV_CHANNELS> routed_{};  ///< the channel of each window
  Image preview_;                          ///< empty if none came
  mutable bool no_layout_ = false;         ///< no program has set one since power-up
  std::vector<std::function<void(const Nodes &)>> undo_;
};

}  // namespace contract

#endif
