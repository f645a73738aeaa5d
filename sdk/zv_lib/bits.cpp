// The bit helpers and the busy-wait delay.
#include "zv_bits.h"

#include <sys/time.h>

#include <cstdint>

u32 mask_bit(u32 value, u32 mask) {
  return value & ~mask;
}

u32 get_bit(u32 value, u32 mask) {
  return value & mask;
}

u32 set_bit(u32 value, u32 mask) {
  return value | mask;
}

u32 restore_bit(u32 value, u32 mask, u32 saved) {
  return mask_bit(value, mask) | saved;
}

namespace {

std::int64_t wall_clock_us() {
  timeval now{};
  gettimeofday(&now, nullptr);
  return std::int64_t{now.tv_sec} * 1000000 + now.tv_usec;
}

}  // namespace

void zv_delay(u32 us) {
  std::int64_t start = wall_clock_us();
  for (std::int64_t now = start; now - start < us; now = wall_clock_us())
    if (now < start) start = now;  // the clock was set back: count from here
}
