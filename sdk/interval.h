/**
 * @file interval.h
 * Frame intervals: what each ZV_INTERVAL_VALUE means. The budget check and the encoder translation
 * share the table; each adds to the skip count by a rule of its own.
 */
#ifndef ZV_INTERVAL_H
#define ZV_INTERVAL_H

#include "zv_type.h"

namespace zarvo {

/// Keep mode encodes one frame of every skip + 1, drop mode all but one of every skip + 1.
struct FrameInterval {
  u32 skip;
  bool drop;
};

inline constexpr FrameInterval kIntervals[] = {
    {0, false}, {9, true},  {5, true},  {4, true},  {3, true},  {2, true},   {1, false},  {2, false},
    {3, false}, {4, false}, {5, false}, {7, false}, {9, false}, {14, false}, {24, false}, {29, false},
};
inline constexpr u32 kIntervalCount = sizeof kIntervals / sizeof kIntervals[0];
static_assert(kIntervalCount == INTERVAL_ZV_INVALID);

/// The meaning of an interval value; an unknown one counts as every frame.
constexpr FrameInterval frame_interval(u32 value) {
  return value < kIntervalCount ? kIntervals[value] : FrameInterval{0, false};
}

/// The interval value of a skip count and mode, or INTERVAL_ZV_INVALID.
constexpr u32 interval_value(FrameInterval interval) {
  for (u32 value = 0; value < kIntervalCount; ++value)
    if (kIntervals[value].skip == interval.skip && kIntervals[value].drop == interval.drop) return value;
  return INTERVAL_ZV_INVALID;
}

}  // namespace zarvo

#endif
