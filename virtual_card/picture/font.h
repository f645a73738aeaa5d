/**
 * @file font.h
 * The digits that the card draws into pictures.
 */
#ifndef VIRTUAL_CARD_FONT_H
#define VIRTUAL_CARD_FONT_H

#include <array>
#include <string_view>

#include "picture.h"

namespace virtual_card {

/// Digits, colon and full stop in one size, with round corners in every size.
class Font {
 public:
  /// `height` is that of a digit, in lines. A glyph is an even number of pixels wide.
  explicit Font(u32 height);

  u32 height() const { return height_; }
  u32 advance() const { return advance_; }
  u32 text_width(std::string_view text) const { return advance_ * static_cast<u32>(text.size()); }
  /// Returns the shape of a character, or null for a character that the font does not have.
  const Coverage *glyph(char character) const;

 private:
  u32 height_;
  u32 advance_;
  std::array<Coverage, 12> glyphs_;
};

/// Paints a text with its top left corner at (x, y); x must be even. A character without a glyph leaves a
/// gap.
void draw_text(Picture &picture, const Font &font, std::string_view text, u32 x, u32 y, Colour colour,
               Lines lines = kAllLines);

/// Returns the channel number as operators count, from 1, in two digits.
std::string_view channel_text(unsigned channel);

}  // namespace virtual_card

#endif
