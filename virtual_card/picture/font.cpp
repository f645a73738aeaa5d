// Draws digits from bitmaps.
#include "font.h"

#include <algorithm>
#include <cmath>

#include "card_state.h"

namespace virtual_card {

namespace {

constexpr u32 kColumns = 7;
constexpr u32 kRows = 10;
constexpr std::string_view kCharacters = "0123456789:.";

/// By character: one number for each row, with the leftmost pixel in bit 6.
constexpr std::array<std::array<u8, kRows>, kCharacters.size()> kBitmaps{{
    {0x1C, 0x3E, 0x63, 0x63, 0x63, 0x63, 0x63, 0x63, 0x3E, 0x1C},
    {0x0C, 0x1C, 0x3C, 0x6C, 0x0C, 0x0C, 0x0C, 0x0C, 0x3F, 0x3F},
    {0x3E, 0x7F, 0x63, 0x03, 0x07, 0x0E, 0x1C, 0x38, 0x7F, 0x7F},
    {0x3E, 0x7F, 0x63, 0x03, 0x1E, 0x1E, 0x03, 0x63, 0x7F, 0x3E},
    {0x0E, 0x1E, 0x36, 0x66, 0x66, 0x7F, 0x7F, 0x06, 0x06, 0x06},
    {0x7F, 0x7F, 0x60, 0x7C, 0x7E, 0x07, 0x03, 0x63, 0x7E, 0x3C},
    {0x1E, 0x3E, 0x60, 0x7C, 0x7E, 0x67, 0x63, 0x63, 0x7E, 0x3C},
    {0x7F, 0x7F, 0x03, 0x06, 0x06, 0x0C, 0x0C, 0x18, 0x18, 0x18},
    {0x3E, 0x7F, 0x63, 0x63, 0x3E, 0x3E, 0x63, 0x63, 0x7F, 0x3E},
    {0x1E, 0x3F, 0x63, 0x63, 0x73, 0x3F, 0x1F, 0x03, 0x3E, 0x3C},
    {0x00, 0x00, 0x18, 0x18, 0x00, 0x00, 0x18, 0x18, 0x00, 0x00},
    {0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x18, 0x18},
}};

constexpr std::array<std::string_view, kChannels> kChannelTexts{
    "01", "02", "03", "04", "05", "06", "07", "08", "09", "10", "11", "12", "13", "14", "15", "16"};

double bit_at(std::size_t index, int column, int row) {
  if (column < 0 || row < 0 || column >= static_cast<int>(kColumns) || row >= static_cast<int>(kRows)) {
    return 0;
  }
  return (kBitmaps[index][static_cast<u32>(row)] >> (kColumns - 1 - static_cast<u32>(column))) & 1;
}

/// Returns the bitmap at a point, interpolated between its pixels: large characters get round corners.
double sample(std::size_t index, double x, double y) {
  const double column = std::floor(x - 0.5), row = std::floor(y - 0.5);
  const double fx = x - 0.5 - column, fy = y - 0.5 - row;
  const int c = static_cast<int>(column), r = static_cast<int>(row);
  const double upper = bit_at(index, c, r) * (1 - fx) + bit_at(index, c + 1, r) * fx;
  const double lower = bit_at(index, c, r + 1) * (1 - fx) + bit_at(index, c + 1, r + 1) * fx;
  return upper * (1 - fy) + lower * fy;
}

Coverage render(std::size_t index, u32 height) {
  const u32 width = (height * kColumns / kRows + 1) & ~1u;
  Coverage glyph{width, height, std::vector<u8>(std::size_t{width} * height)};
  const double scale = static_cast<double>(kRows) / height;
  const double edge = std::max(1.0, 1.5 / scale);
  for (u32 line = 0; line < height; ++line) {
    for (u32 x = 0; x < width; ++x) {
      const double inside = sample(index, (x + 0.5) * kColumns / width, (line + 0.5) * scale);
      const double alpha = std::clamp((inside - 0.45) * edge + 0.5, 0.0, 1.0);
      glyph.alpha[std::size_t{line} * width + x] = static_cast<u8>(std::lround(alpha * 255.0));
    }
  }
  return glyph;
}

}  // namespace

Font::Font(u32 height) : height_(height), advance_((height * (kColumns + 1) / kRows + 1) & ~1u) {
  for (std::size_t i = 0; i < glyphs_.size(); ++i) glyphs_[i] = render(i, height);
}

const Coverage *Font::glyph(char character) const {
  const std::size_t index = kCharacters.find(character);
  return index == std::string_view::npos ? nullptr : &glyphs_[index];
}

void draw_text(Picture &picture, const Font &font, std::string_view text, u32 x, u32 y, Colour colour,
               Lines lines) {
  for (const char character : text) {
    if (const Coverage *glyph = font.glyph(character)) blend(picture, *glyph, x, y, colour, lines);
    x += font.advance();
  }
}

std::string_view channel_text(unsigned channel) {
  return kChannelTexts[channel % kChannels];
}

}  // namespace virtual_card
