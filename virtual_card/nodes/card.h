/**
 * @file card.h
 * The card of this process: its four device nodes and the thread that runs it. It handles calls on device
 * nodes and does not depend on how they reach it. Results below zero are negated error numbers.
 */
#ifndef VIRTUAL_CARD_CARD_H
#define VIRTUAL_CARD_CARD_H

#include <sys/types.h>

#include "control_server.h"
#include "device.h"
#include "requests.h"
#include "runner.h"

namespace virtual_card {

/// Returns the device of a path, or Device::none for a node that the card does not have.
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
  /// Returns the card; creates it at the first use. It is never destroyed: threads of the host may still run
  /// after the destructors of static objects. Throws std::system_error with EBUSY when called while the card
  /// is being created on this thread.
  static Card &instance();
  /// Call these around fork(). A forked child has none of the card's threads, so it creates a card of its
  /// own.
  static void before_fork();
  static void after_fork(bool child);

  /// Returns a new descriptor of a node. `sibling` is an open descriptor of the same node, or -1.
  long open(Device device, int flags, int sibling);
  /// Returns the result of closing a descriptor. The caller closes it in any case and then calls closed().
  long close(Device device);
  long ioctl(Device device, u32 code, std::uintptr_t argument);
  long read(Device device, std::uintptr_t buffer, std::size_t count);
  /// Maps the device's region through the descriptor `fd`.
  long mmap(Device device, int fd, const MapRequest &request, void *&mapped);
  /// Returns the result of unmapping. On 0 the caller unmaps the region and then calls unmapped().
  long munmap(Device device, std::size_t length);

  /// Count the descriptors and mappings in use. When the last descriptor is closed, the card stops.
  void duplicated();
  void closed();
  void unmapped(int count);
  int open_descriptors();
  int open_mappings();

  /// reset() restores the power-up state, set_clock() the clock. While a node is open, both do nothing and
  /// return false.
  bool reset();
  bool set_clock(ClockMode mode, double speed);
  /// Ends the threads at the end of the process; they cannot be started again.
  void power_off();

  Board &board() { return board_; }
  Runner &runner() { return runner_; }

 private:
  Card();
  void power_up();
  DeviceNode *node(Device device);
  void stop();
  /// Stops the card, saves its state and reports the frames that the host did not read in time.
  void last_close();
  void log(Call call, long result);

  Board board_;
  std::array<std::unique_ptr<DeviceNode>, 4> nodes_;
  Runner runner_{board_};
  ControlServer control_{board_.log,
                         [this](std::string_view request) { return answer_request(*this, request); }};
  std::mutex power_mutex_;  // guards the members below, and start and stop of runner_
  int open_ = 0;
  int mapped_ = 0;
  std::string state_file_;  // none: empty
  bool off_ = false;
};

}  // namespace virtual_card

#endif
