/**
 * @file interval.h
 * The meaning of each ZV_INTERVAL_VALUE. The budget check and the encoder translation share this table;
 * each has its own rule for adding 1 to the skip count.
 */
#ifndef ZV_INTERVAL_H
#define ZV_INTERVAL_H

#include "zv_type.h"

namespace zarvo {

/// Keep mode encodes one frame of every skip + 1. Drop mode drops one frame of every skip + 1.
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

/// Returns the skip count and mode of an interval value; an unknown value means every frame.
constexpr FrameInterval frame_interval(u32 value) {
  return value < kIntervalCount ? kIntervals[value] : FrameInterval{0, false};
}

/// Returns the interval value of a skip count and mode, or INTERVAL_ZV_INVALID if there is none.
constexpr u32 interval_value(FrameInterval interval) {
  for (u32 value = 0; value < kIntervalCount; ++value)
    if (kIntervals[value].skip == interval.skip && kIntervals[value].drop == interval.drop) return value;
  return INTERVAL_ZV_INVALID;
}

}  // namespace zarvo

#endif
