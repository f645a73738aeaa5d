#ifndef VIRTUAL_CARD_INJECTOR_H
#define VIRTUAL_CARD_INJECTOR_H

#include <atomic>
#include <mutex>

#include "virtual_card.h"

namespace virtual_card {

/// Makes operations on the device nodes fail, once or for good, after a countdown.
class Injector {
 public:
  void set(const Fault &fault);
  void clear();
  int hits() const;
  void reset();
  /// The error number this operation fails with, or 0.
  int strike(Operation operation, Device device, std::uint32_t code = 0);

 private:
  std::atomic<bool> armed_{false};  // whether fault_ can still strike: keeps the lock off the frame path
  mutable std::mutex mutex_;        // guards fault_ and hits_
  Fault fault_{};
  int hits_ = 0;
};

}  // namespace virtual_card

#endif
