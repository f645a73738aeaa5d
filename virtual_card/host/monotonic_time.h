/**
 * @file monotonic_time.h
 * The kernel's monotonic clock, by which the card keeps time.
 */
#ifndef VIRTUAL_CARD_MONOTONIC_TIME_H
#define VIRTUAL_CARD_MONOTONIC_TIME_H

#include <chrono>

namespace virtual_card {

using MonotonicTime = std::chrono::steady_clock::time_point;

/// Asks the kernel directly: a library that fakes the time for the host would otherwise make the card's
/// waits, which the kernel times, end at the wrong moment.
MonotonicTime monotonic_now();

}  // namespace virtual_card

#endif
