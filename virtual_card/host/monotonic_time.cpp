// Reads the kernel's monotonic clock with a system call.
#include "monotonic_time.h"

#include <sys/syscall.h>
#include <unistd.h>

#include <ctime>

namespace virtual_card {

MonotonicTime monotonic_now() {
  std::timespec now{};
  ::syscall(SYS_clock_gettime, CLOCK_MONOTONIC, &now);
  return MonotonicTime{std::chrono::seconds{now.tv_sec} + std::chrono::nanoseconds{now.tv_nsec}};
}

}  // namespace virtual_card
