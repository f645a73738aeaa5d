/// Processor clocks, and the bare driver the SDK is measured against: the calls of a capture pass on the
/// device nodes, and nothing else.
#ifndef BENCH_MEASURE_H
#define BENCH_MEASURE_H

#include <cstdint>
#include <filesystem>
#include <functional>
#include <string>
#include <vector>

#include "virtual_card.h"
#include "zv_type.h"

namespace bench {

double thread_cpu_ns();
double process_cpu_ns();

/// A folder of its own, gone at the end.
class Folder {
 public:
  Folder();
  ~Folder();
  Folder(const Folder &) = delete;
  Folder &operator=(const Folder &) = delete;
  const std::filesystem::path &path() const { return path_; }

 private:
  std::filesystem::path path_;
};

/// What a program has used.
struct Usage {
  double wall_ns;
  double cpu_ns;
  double kilobytes;  ///< the most memory at a time
};
/// Runs a program to its end. Aborts if it fails.
Usage run_program(std::vector<std::string> words);

/// The device nodes, opened and mapped without the SDK.
class BareDriver {
 public:
  BareDriver();
  ~BareDriver();
  BareDriver(const BareDriver &) = delete;
  BareDriver &operator=(const BareDriver &) = delete;

  void start();
  void stop();
  /// One pass of a capture loop: pause, request, read, release, Motion-JPEG read. `on_mpeg4` and `on_mjpeg`
  /// get the data where the card put it.
  using Sink = std::function<void(u32 channel, const u8 *data, std::size_t length)>;
  void pass(const Sink &on_mpeg4, const Sink &on_mjpeg);
  /// One audio read; the four blocks of 48 bytes, or null.
  const u8 *audio();

 private:
  int encoder_;
  int audio_;
  u8 *region_;
  alignas(64) u8 audio_blocks_[768] = {};
};

/// A supply of one ready-made frame a channel, `size` bytes of bitstream each, Motion JPEG as well.
virtual_card::Supply ready_made_supply(std::size_t size, bool mpeg4, bool mjpeg, std::uint64_t limit);

/// A supply of real CIF streams of all sixteen cameras and four inputs, `frames` a channel, taken from the
/// card's own encoders.
virtual_card::Supply encoded_supply(int frames);

}  // namespace bench

#endif
