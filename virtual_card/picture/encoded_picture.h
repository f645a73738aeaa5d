/**
 * @file encoded_picture.h
 * The encoder's side of a picture: which fields it takes, at what size, in 4:2:0.
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

/// Size of a channel's encoded picture; none when its scale code stands for no encoding.
std::optional<EncodedSize> encoded_size(u32 scale_code, u32 input_width, u32 input_lines);

/// Whether a picture is encoded when this field has come. Pictures of one field skip fields in keep
/// mode and frames in drop mode; interlaced pictures skip frames, and are whole with the bottom field.
bool picture_due(u32 interval_code, bool interlaced, std::int64_t field);
/// Pictures a second of an interval code.
double picture_rate(u32 interval_code, bool interlaced, u32 standard);

/// A 4:2:0 picture without padding.
struct EncodedPicture {
  EncodedSize size{};
  std::vector<u8> y;
  std::vector<u8> cb;
  std::vector<u8> cr;
};

/// Scales the field of this parity, or both when the size is interlaced.
void scale_picture(const Picture &from, u32 parity, EncodedSize size, EncodedPicture &to);
/// Burns the channel's number into the top left corner.
void burn_number(EncodedPicture &picture, unsigned channel, const Font &font);

}  // namespace virtual_card

#endif
