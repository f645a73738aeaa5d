/**
 * @file video_standard.h
 * The two video standards: lines of a frame and exact period of a field.
 */
#ifndef VIRTUAL_CARD_VIDEO_STANDARD_H
#define VIRTUAL_CARD_VIDEO_STANDARD_H

#include <chrono>
#include <cstdint>

#include "zv_type.h"

namespace virtual_card {

struct VideoStandard {
  u32 lines;               ///< lines of a frame
  int nominal_frames;      ///< frames a second, rounded; the clock in the picture counts these
  std::int64_t period_ns;  ///< a field lasts exactly period_ns / period_parts nanoseconds
  std::int64_t period_parts;

  /// Returns the duration of a number of fields. It is rounded only once, so rounding errors do not add up.
  constexpr std::chrono::nanoseconds duration(std::int64_t fields) const {
    return std::chrono::nanoseconds{fields * period_ns / period_parts};
  }
  constexpr double field_seconds() const {
    return static_cast<double>(period_ns) / static_cast<double>(period_parts) * 1e-9;
  }
  constexpr double frames_per_second() const { return 0.5 / field_seconds(); }
};

inline constexpr VideoStandard kNtsc{480, 30, 50'050'000, 3};  // 1001 / 60000 s
inline constexpr VideoStandard kPal{576, 25, 20'000'000, 1};   // 1 / 50 s

/// Returns the standard of a ZV_VIDEO_STANDARD; every value but NTSC is PAL.
constexpr const VideoStandard &video_standard(u32 standard) {
  return standard == VIDEO_STANDARD_ZV_NTSC ? kNtsc : kPal;
}

}  // namespace virtual_card

#endif
