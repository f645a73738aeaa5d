/**
 * @file card.h
 * The card of this process: its four device nodes and what powers them. It knows calls on device
 * nodes, not how they get here. Results below zero are negated error numbers.
 */
#ifndef VIRTUAL_CARD_CARD_H
#define VIRTUAL_CARD_CARD_H

#include <sys/types.h>

#include "device.h"
#include "runner.h"

namespace virtual_card {

/// The device behind a path, Device::none for a node the card does not have.
Device device_of(const char *path);

struct MapRequest {
  void *address;
  std::size_t length;
  int protection;
  int flags;
  off_t offset;
};

class Card {
 public:
  /// Made at the first use, and never destroyed: the host's threads may outlive its destructors.
  /// Throws std::system_error, EBUSY, where making it leads back here.
  static Card &instance();
  /// A forked child has none of the card's threads: it begins with a card of its own.
  static void before_fork();
  static void after_fork(bool child);

  /// A new descriptor. `sibling` is one of the same node that is open, or -1.
  long open(Device device, int flags, int sibling);
  /// Whether closing reports a failure. The descriptor goes in any case; closed() says that it has.
  long close(Device device);
  long ioctl(Device device, u32 code, std::uintptr_t argument);
  long read(Device device, std::uintptr_t buffer, std::size_t count);
  /// Maps the device's region through its descriptor.
  long mmap(Device device, int fd, const MapRequest &request, void *&mapped);
  /// Whether unmapping reports a failure, and then does not happen; unmapped() says that it has.
  long munmap(Device device, std::size_t length);

  /// Count the descriptors and mappings in use. With the last descriptor the card stops.
  void duplicated();
  void closed();
  void unmapped(int count);
  int open_descriptors();
  int open_mappings();

  /// As built. False, and nothing done, while a node is open.
  bool reset();
  bool set_clock(ClockMode mode, double speed);
  /// Ends the threads for good, as the process does.
  void power_off();

  Board &board() { return board_; }
  Runner &runner() { return runner_; }

 private:
  Card();
  void apply_options();
  DeviceNode *node(Device device);
  void stop_if_unused();
  void log(Call call, long result);

  Board board_;
  std::array<std::unique_ptr<DeviceNode>, 4> nodes_;
  Runner runner_{board_};
  std::mutex power_mutex_;  // guards what follows and the runner's start and stop
  int open_ = 0;
  int mapped_ = 0;
  bool off_ = false;
};

}  // namespace virtual_card

#endif
