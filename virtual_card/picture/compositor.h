/**
 * @file compositor.h
 * The preview picture: windows, picture-in-picture, zoom, motion marks, grid and frames.
 */
#ifndef VIRTUAL_CARD_COMPOSITOR_H
#define VIRTUAL_CARD_COMPOSITOR_H

#include <array>
#include <span>
#include <vector>

#include "card_state.h"
#include "motion_detector.h"
#include "picture.h"
#include "pixel_ops.h"

namespace virtual_card {

/// A window of the preview: its channel (kChannels: black) and its area.
struct View {
  unsigned channel;
  Area area;
  bool both_fields;  ///< the window has more lines than one field
};

/// Returns the visible windows in the order of painting.
std::vector<View> views(const CardState &state);

/// The data of a channel that its views are painted from.
struct ViewSource {
  const Picture *picture = nullptr;
  const MovedBlocks *marks = nullptr;  ///< blocks to outline; null: no motion marks
};

class Compositor {
 public:
  void compose(const CardState &state, std::span<const View> windows,
               const std::array<ViewSource, kChannels> &sources, std::span<u8> uyvy);

 private:
  /// Scales one plane of a view line by line.
  class PlaneScaler {
   public:
    void prepare(u32 in_width, u32 out_width);
    /// Returns one output row, mixed from two input rows. `weight` is that of `second`, in 256ths.
    const u8 *row(const u8 *first, const u8 *second, unsigned weight);

   private:
    u32 in_width_ = 0;
    u32 out_width_ = 0;
    u32 halved_width_ = 0;
    std::vector<Tap> taps_;
    std::array<std::vector<u8>, 2> buffer_;
  };

  void paint(const View &view, const Picture &picture);

  u8 *screen_ = nullptr;
  u32 width_ = 0;
  u32 lines_ = 0;
  PlaneScaler luma_, cb_, cr_;
  std::vector<u8> unzoomed_;
};

}  // namespace virtual_card

#endif
