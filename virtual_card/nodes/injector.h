/**
 * @file injector.h
 * Makes operations on the device nodes fail, for tests.
 */
#ifndef VIRTUAL_CARD_INJECTOR_H
#define VIRTUAL_CARD_INJECTOR_H

#include <atomic>
#include <mutex>

#include "virtual_card.h"

namespace virtual_card {

/// Makes operations on the device nodes fail after a countdown, once or from then on.
class Injector {
 public:
  void set(const Fault &fault);
  void clear();
  int hits() const;
  void reset();
  /// Counts an operation. Returns the error number with which it must fail, or 0.
  int strike(Operation operation, Device device, std::uint32_t code = 0);

 private:
  std::atomic<bool> armed_{false};  // fault_ can still strike; read without the lock on the frame path
  mutable std::mutex mutex_;        // guards fault_ and hits_
  Fault fault_{};
  int hits_ = 0;
};

}  // namespace virtual_card

#endif
