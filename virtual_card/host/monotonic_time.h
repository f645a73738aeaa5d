/**
 * @file monotonic_time.h
 * The kernel's monotonic clock, which the card uses for its own time.
 */
#ifndef VIRTUAL_CARD_MONOTONIC_TIME_H
#define VIRTUAL_CARD_MONOTONIC_TIME_H

#include <chrono>

namespace virtual_card {

using MonotonicTime = std::chrono::steady_clock::time_point;

/// Returns the time from the kernel, not from libc: another preloaded library may fake libc's clock, but the
/// card's waits end by the kernel's clock.
MonotonicTime monotonic_now();

}  // namespace virtual_card

#endif
