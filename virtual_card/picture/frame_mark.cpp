// Draws and reads the frame mark.
#include "frame_mark.h"

#include <array>
#include <cstring>

#include "card_state.h"

namespace virtual_card {

namespace {

// Blocks from the left: a margin of 2, the sync pattern white black white black, channel (4 bits), frame
// number (24 bits), check (7 bits), bottom field (1 bit), a margin of 2. The check does not cover the
// bottom-field bit, so the two fields of a frame differ in one block only and a full-height picture has one
// readable mark.
constexpr u32 kBlockWidth = 16;
constexpr u32 kMargin = 2;
constexpr u32 kSync = 4;
constexpr u32 kChannelBits = 4;
constexpr u32 kFrameBits = 24;
constexpr u32 kCheckBits = 7;
constexpr u32 kBlocks = kSync + kChannelBits + kFrameBits + kCheckBits + 1;
constexpr u32 kHeight = 16;      ///< lines of the mark in a full-height picture
constexpr u32 kFromBottom = 32;  ///< lines from the top of the mark to the bottom of the picture
constexpr std::uint64_t kSyncPattern = 0b1010;
constexpr std::uint32_t kFrameMask = (1u << kFrameBits) - 1;
/// With less contrast between the sync blocks, there is no mark or it cannot be trusted.
constexpr int kMinContrast = 24;

u32 check(std::uint64_t payload) {
  return static_cast<u32>(((payload + 1) * 0x9E3779B97F4A7C15u) >> (64 - kCheckBits));
}

std::uint64_t to_bits(const FrameMark &mark) {
  const std::uint64_t payload = (std::uint64_t{mark.channel} << kFrameBits) | (mark.frame & kFrameMask);
  std::uint64_t bits = kSyncPattern << (kChannelBits + kFrameBits) | payload;
  bits = bits << kCheckBits | check(payload);
  return bits << 1 | (mark.bottom_field ? 1 : 0);
}

bool bit(std::uint64_t bits, u32 block) {
  return (bits >> (kBlocks - 1 - block)) & 1;
}

}  // namespace

Area frame_mark_area(u32 width, u32 lines) {
  const u32 x = (width - kNarrowWidth) / 2 + kMargin * kBlockWidth;
  return {x, lines - kFromBottom, x + kBlocks * kBlockWidth, lines - kFromBottom + kHeight};
}

void draw_frame_mark(Picture &picture, const FrameMark &mark, u8 black, u8 white, Lines lines) {
  const Area area = frame_mark_area(picture.width, picture.lines);
  const std::uint64_t bits = to_bits(mark);
  std::array<u8, kBlocks * kBlockWidth> row;
  for (u32 block = 0; block < kBlocks; ++block) {
    std::memset(row.data() + block * kBlockWidth, bit(bits, block) ? white : black, kBlockWidth);
  }
  for (u32 line = lines.at_or_after(area.y_start); line < area.y_end; line += lines.step) {
    std::memcpy(picture.y_line(line) + area.x_start, row.data(), row.size());
  }
}

std::optional<FrameMark> read_frame_mark(const u8 *luma, std::size_t stride, u32 width, u32 height) {
  const bool both_fields = height > 288;
  const u32 vertical = both_fields ? 1 : 2;
  // Pictures 720 pixels wide have 8 pixels on each side that the scaled pictures do not have.
  const u32 margin = width == kMaxWidth ? (kMaxWidth - kNarrowWidth) / 2 : 0;
  const u32 block_width = (width - 2 * margin) * kBlockWidth / kNarrowWidth;
  if (block_width < 4 || height < kFromBottom) return std::nullopt;

  const u32 top = height - kFromBottom / vertical;
  const auto level = [&](u32 block) {
    // Sum the middle of the block: half of its width, and a few lines of the top field.
    const u32 x = margin + (kMargin + block) * block_width + block_width / 4;
    int sum = 0;
    for (u32 line = (top + kHeight / vertical / 4) & ~1u; line < top + kHeight / vertical * 3 / 4;
         line += 2) {
      for (u32 i = 0; i < block_width / 2; ++i) sum += luma[line * stride + x + i];
    }
    return sum;
  };
  const int samples = static_cast<int>(block_width / 2 * (kHeight / vertical / 4));
  const int white = level(0) + level(2);
  const int black = level(1) + level(3);
  if (white - black < 2 * kMinContrast * samples) return std::nullopt;

  std::uint64_t bits = 0;
  for (u32 block = 0; block < kBlocks; ++block) {
    bits = bits << 1 | (4 * level(block) > white + black ? 1 : 0);
  }
  const std::uint64_t payload = (bits >> (kCheckBits + 1)) & ((1u << (kFrameBits + kChannelBits)) - 1);
  FrameMark mark{static_cast<unsigned>(payload >> kFrameBits), static_cast<u32>(payload) & kFrameMask,
                 !both_fields && (bits & 1)};
  FrameMark read = mark;
  read.bottom_field = bits & 1;
  if (to_bits(read) != bits) return std::nullopt;
  return mark;
}

}  // namespace virtual_card
