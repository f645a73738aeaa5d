/**
 * @file frame_mark.h
 * The frame mark: a strip of black and white blocks near the bottom of a drawn picture. It contains channel,
 * frame number and field for a program to read. It survives scaling and both codecs.
 */
#ifndef VIRTUAL_CARD_FRAME_MARK_H
#define VIRTUAL_CARD_FRAME_MARK_H

#include <cstddef>
#include <cstdint>
#include <optional>

#include "picture.h"

namespace virtual_card {

struct FrameMark {
  unsigned channel;
  std::uint32_t frame;  ///< frames since power-up, modulo 2^24; 0 in Scene::still
  bool bottom_field;    ///< false in full-height pictures, which hold both fields

  bool operator==(const FrameMark &) const = default;
};

/// Returns the place of the mark in a picture of this size.
Area frame_mark_area(u32 width, u32 lines);
/// Paints the luma of the mark into the given lines. Does not paint chroma: the backdrop has filled the area
/// with grey.
void draw_frame_mark(Picture &picture, const FrameMark &mark, u8 black, u8 white, Lines lines);

/// Reads the mark from a luma plane of any encoded size. Returns none when there is no valid mark.
std::optional<FrameMark> read_frame_mark(const u8 *luma, std::size_t stride, u32 width, u32 height);

}  // namespace virtual_card

#endif
