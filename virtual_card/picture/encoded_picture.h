/**
 * @file encoded_picture.h
 * The picture that goes into the encoders: its fields, its size, and its samples in 4:2:0.
 */
#ifndef VIRTUAL_CARD_ENCODED_PICTURE_H
#define VIRTUAL_CARD_ENCODED_PICTURE_H

#include <cstdint>
#include <optional>
#include <vector>

#include "card_state.h"
#include "font.h"
#include "picture.h"

namespace virtual_card {

struct EncodedSize {
  u32 width;
  u32 height;
  bool interlaced;

  bool operator==(const EncodedSize &) const = default;
};

/// Returns the size of a channel's encoded picture; none when its scale code means no encoding.
std::optional<EncodedSize> encoded_size(u32 scale_code, u32 input_width, u32 input_lines);

/// Returns whether a picture is encoded after this field; picture_rate() lists the rates. A one-field picture
/// in drop mode is a top field. An interlaced picture is encoded after its bottom field.
bool picture_due(u32 interval_code, bool interlaced, std::int64_t field);
/// Returns pictures a second of an interval code. Keep mode, one-field pictures: code 0 encodes every field,
/// code n one field of every n-th frame. Keep mode, interlaced: one picture every code + 1 frames. Drop mode
/// leaves out one of every skip + 1 frames.
double picture_rate(u32 interval_code, bool interlaced, u32 standard);

/// A 4:2:0 picture without padding between rows.
struct EncodedPicture {
  EncodedSize size{};
  std::vector<u8> y;
  std::vector<u8> cb;
  std::vector<u8> cr;
};

/// Scales the field of this parity, or both fields when the size is interlaced.
void scale_picture(const Picture &from, u32 parity, EncodedSize size, EncodedPicture &to);
/// Draws the channel number into the top left corner.
void burn_number(EncodedPicture &picture, unsigned channel, const Font &font);

}  // namespace virtual_card

#endif
