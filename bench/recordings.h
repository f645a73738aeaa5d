/// What the benchmarks of recording programs share: the frames, and the two things a program is compared
/// with, a bare loop of driver calls and ffmpeg.
#ifndef BENCH_RECORDINGS_H
#define BENCH_RECORDINGS_H

#include <cstdint>
#include <filesystem>
#include <fstream>
#include <functional>
#include <set>
#include <string>

#include "measure.h"

namespace bench {

namespace fs = std::filesystem;

/// Real streams of sixteen CIF channels and four audio inputs, so many video frames, at 480 frames a second
/// or as fast as they are read.
virtual_card::Supply supply_of(std::uint64_t frames, bool paced);
void wait_for_the_end(std::uint64_t frames, bool mjpeg);

std::set<std::string> threads();

/// Processor time of the threads that `start` brings up, when `wait` returns: the host's side of the capture,
/// without the card's own threads.
template <typename Start, typename Wait>
double cpu_of_new_threads(Start start, Wait wait) {
  const std::set<std::string> before = threads();
  start();
  const std::set<std::string> now = threads();
  wait();
  double sum = 0;
  for (const std::string &id : now) {
    double ns = 0;
    if (before.count(id) == 0 && std::ifstream("/proc/self/task/" + id + "/schedstat") >> ns) sum += ns;
  }
  return sum;
}

/// A recording program: records into a folder and returns the processor time of its threads.
using Program = std::function<double(const fs::path &folder, std::uint64_t frames, bool mjpeg, bool paced)>;

/// Compares with a bare loop of the same driver calls and one write() a frame, as fast as given.
void compare_with_bare_calls(const std::string &name, double limit, bool mjpeg, const Program &program);

/// Compares with a stream copy by ffmpeg. Entering and leaving the prescribed pauses of the capture threads
/// depends on the machine more than on the program, so the ratio with a limit leaves it out.
void compare_with_ffmpeg(const std::string &name, double limit, std::uint64_t frames, bool mjpeg, bool paced,
                         const Program &program);

}  // namespace bench

#endif
