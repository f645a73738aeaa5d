/**
 * @file field_moment.h
 * A field in card time, with what all cameras burn into it.
 */
#ifndef VIRTUAL_CARD_FIELD_MOMENT_H
#define VIRTUAL_CARD_FIELD_MOMENT_H

#include <array>
#include <chrono>
#include <cstdint>
#include <string_view>

#include "zv_type.h"

namespace virtual_card {

class FieldMoment {
 public:
  FieldMoment() = default;
  FieldMoment(u32 standard, std::int64_t number, std::chrono::microseconds wall_time);

  /// The same for the field before this one.
  FieldMoment field_before() const;

  u32 parity() const { return static_cast<u32>(number & 1); }
  /// HH:MM:SS.ff in local time, ff the frame within the second; one text for both fields of a frame.
  std::string_view clock() const { return {clock_.data(), clock_.size()}; }

  std::int64_t number = 0;  ///< fields since power-up; even: top field
  double seconds = 0;       ///< card time

 private:
  u32 standard_ = 0;
  std::chrono::microseconds wall_time_{0};
  std::array<char, 11> clock_{};
};

}  // namespace virtual_card

#endif
