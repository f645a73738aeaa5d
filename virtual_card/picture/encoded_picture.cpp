// Chooses the fields to encode and scales them to the encoded size.
#include "encoded_picture.h"

#include <array>
#include <cstring>

#include "pixel_ops.h"

namespace virtual_card {

namespace {

constexpr u32 kCifWidth = 352;
constexpr u32 kOverlayX = 16;
constexpr u32 kOverlayY = 8;

bool drop_mode(u32 code) {
  return ((code >> driver::kIntervalDropShift) & 1) != 0;
}
u32 period(u32 code) {
  return (code & driver::kIntervalSkipMask) + 1;
}

/// Returns the distance in fields between two encoded fields in keep mode. Code 0 encodes every field, code n
/// one field of every n-th frame.
std::int64_t kept_field(u32 code) {
  const std::int64_t skipped = code & driver::kIntervalSkipMask;
  return skipped == 0 ? 1 : 2 * skipped;
}

/// Scales a row to the encoded width. A CIF row is made from the middle 704 pixels of both input widths.
void fit_row(const u8 *in, u32 in_width, u8 *out, u32 out_width) {
  if (in_width == out_width) {
    std::memcpy(out, in, out_width);
  } else {
    halve_row(in + (in_width - 2 * out_width) / 2, out, out_width);
  }
}

}  // namespace

std::optional<EncodedSize> encoded_size(u32 scale_code, u32 input_width, u32 input_lines) {
  switch (scale_code) {
    case SCALE_ZV_HALF_D1:
      return EncodedSize{input_width, input_lines / 2, false};
    case SCALE_ZV_CIF:
      return EncodedSize{kCifWidth, input_lines / 2, false};
    case driver::kScaleCodeD1:
      return EncodedSize{input_width, input_lines, true};
    default:
      return std::nullopt;
  }
}

bool picture_due(u32 interval_code, bool interlaced, std::int64_t field) {
  const std::int64_t frame = field / 2;
  const bool bottom = field % 2 != 0;
  const std::int64_t every = period(interval_code);
  if (drop_mode(interval_code)) return bottom == interlaced && frame % every != every - 1;
  return interlaced ? bottom && frame % every == 0 : field % kept_field(interval_code) == 0;
}

double picture_rate(u32 interval_code, bool interlaced, u32 standard) {
  const double frames = video_standard(standard).frames_per_second();
  const double every = period(interval_code);
  if (drop_mode(interval_code)) return frames * (every - 1) / every;
  return interlaced ? frames / every : 2 * frames / static_cast<double>(kept_field(interval_code));
}

void scale_picture(const Picture &from, u32 parity, EncodedSize size, EncodedPicture &to) {
  const u32 chroma_width = size.width / 2;
  const u32 fields = size.interlaced ? 2 : 1;
  to.y.resize(std::size_t{size.width} * size.height);
  to.cb.resize(to.y.size() / 4);
  to.cr.resize(to.y.size() / 4);
  to.size = size;

  for (u32 line = 0; line < size.height; ++line) {
    const u32 source = size.interlaced ? line : 2 * line + parity;
    fit_row(from.y_line(source), from.width, to.y.data() + std::size_t{line} * size.width, size.width);
  }
  // A chroma line of the 4:2:0 picture is the mean of two lines of the same field.
  std::array<u8, kCifWidth * 2> mean;
  for (u32 line = 0; line < size.height / 2; ++line) {
    const u32 field = size.interlaced ? line % 2 : parity;
    const u32 source = line / fields * 4 + field;
    const std::size_t out = std::size_t{line} * chroma_width;
    average_rows(from.cb_line(source), from.cb_line(source + 2), mean.data(), from.width / 2);
    fit_row(mean.data(), from.width / 2, to.cb.data() + out, chroma_width);
    average_rows(from.cr_line(source), from.cr_line(source + 2), mean.data(), from.width / 2);
    fit_row(mean.data(), from.width / 2, to.cr.data() + out, chroma_width);
  }
}

void burn_number(EncodedPicture &picture, unsigned channel, const Font &font) {
  const u32 width = picture.size.width;
  u32 x = kOverlayX;
  const u32 box_lines = font.height() + 8, box_width = font.text_width(channel_text(channel)) + 8;
  for (u32 line = 0; line < box_lines; ++line) {
    const std::size_t at = std::size_t{kOverlayY + line};
    std::memset(picture.y.data() + at * width + x - 4, kBlack.y, box_width);
    std::memset(picture.cb.data() + at / 2 * (width / 2) + (x - 4) / 2, kBlack.cb, box_width / 2);
    std::memset(picture.cr.data() + at / 2 * (width / 2) + (x - 4) / 2, kBlack.cr, box_width / 2);
  }
  for (const char character : channel_text(channel)) {
    const Coverage &glyph = *font.glyph(character);
    for (u32 line = 0; line < glyph.lines; ++line) {
      u8 *const row = picture.y.data() + std::size_t{kOverlayY + 4 + line} * width + x;
      const u8 *const alpha = glyph.alpha.data() + std::size_t{line} * glyph.width;
      for (u32 i = 0; i < glyph.width; ++i) {
        row[i] = static_cast<u8>(kBlack.y + (kWhite.y - kBlack.y) * alpha[i] / 255);
      }
    }
    x += font.advance();
  }
}

}  // namespace virtual_card
