/**
 * @file field.h
 * A field of video in card time.
 */
#ifndef VIRTUAL_CARD_FIELD_H
#define VIRTUAL_CARD_FIELD_H

#include <array>
#include <string_view>

#include "video_standard.h"

namespace virtual_card {

struct Field {
  u32 standard = VIDEO_STANDARD_ZV_NTSC;
  std::int64_t number = 0;                ///< fields since power-up; even: top field
  std::chrono::microseconds wall_time{};  ///< since the epoch, for descriptors and the clock in the picture

  u32 parity() const { return static_cast<u32>(number & 1); }
  /// Returns the card time of the field, as if all fields since power-up had its standard.
  double seconds() const { return static_cast<double>(number) * video_standard(standard).field_seconds(); }
  Field before() const;
};

/// The clock that cameras draw into a field: HH:MM:SS.ff in local time, where ff is the frame within the
/// second. Both fields of a frame show the same text.
class ClockText {
 public:
  explicit ClockText(const Field &field);
  std::string_view view() const { return {text_.data(), text_.size()}; }

 private:
  std::array<char, 11> text_{};
};

}  // namespace virtual_card

#endif
