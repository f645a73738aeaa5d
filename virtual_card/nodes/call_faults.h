/**
 * @file call_faults.h
 * Makes calls on the device nodes fail or take long.
 */
#ifndef VIRTUAL_CARD_CALL_FAULTS_H
#define VIRTUAL_CARD_CALL_FAULTS_H

#include <atomic>
#include <chrono>
#include <memory>
#include <mutex>
#include <vector>

#include "virtual_card.h"

namespace virtual_card {

/// Makes matching calls fail: after the first `skip`, every `every`-th, at most `times` times.
struct CallFault {
  Device device = Device::none;  ///< none: every node
  Operation operation = Operation::open;
  std::uint32_t code = 0;  ///< ioctl: command code; 0: every command
  int error = 0;
  std::uint64_t skip = 0;
  std::uint64_t every = 1;
  std::uint64_t times = ~std::uint64_t{0};
  std::uint64_t seen = 0;  ///< calls that matched so far; kept while the fault is off
};

class CallFaults {
 public:
  void set(std::vector<std::shared_ptr<CallFault>> faults, std::chrono::milliseconds delay);
  /// Counts a call and delays it. Returns the error number with which it must fail, or 0.
  int strike(Operation operation, Device device, std::uint32_t code = 0);
  /// Returns how many calls have failed.
  std::uint64_t hits() const { return hits_.load(std::memory_order_relaxed); }
  void reset_hits() { hits_ = 0; }

 private:
  std::atomic<bool> armed_{false};  // there is a fault or a delay; read without the lock on the frame path
  std::atomic<std::uint64_t> hits_{0};
  std::mutex mutex_;  // guards the members below
  std::vector<std::shared_ptr<CallFault>> faults_;
  std::chrono::milliseconds delay_{0};
};

}  // namespace virtual_card

#endif
