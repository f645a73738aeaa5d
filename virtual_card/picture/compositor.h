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

/// A window that shows a channel.
struct View {
  unsigned channel;
  Area area;
  bool both_fields;  ///< so large that one field has too few lines for it
};

/// The windows that show something, in the order they are painted.
std::vector<View> views(const CardState &state);

/// What a view is painted from.
struct ViewSource {
  const Picture *picture = nullptr;
  const MovedBlocks *marks = nullptr;  ///< null: no motion marks
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
    /// One output row out of two input rows.
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
