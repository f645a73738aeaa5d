// Makes operations on the device nodes fail.
#include "injector.h"

namespace virtual_card {

void Injector::set(const Fault &fault) {
  const std::lock_guard lock(mutex_);
  fault_ = fault;
  hits_ = 0;
  armed_ = true;
}

void Injector::clear() {
  armed_ = false;
}

int Injector::hits() const {
  const std::lock_guard lock(mutex_);
  return hits_;
}

void Injector::reset() {
  const std::lock_guard lock(mutex_);
  armed_ = false;
  hits_ = 0;
}

int Injector::strike(Operation operation, Device device, std::uint32_t code) {
  if (!armed_.load(std::memory_order_relaxed)) return 0;
  const std::lock_guard lock(mutex_);
  const bool matches = armed_ && operation == fault_.operation &&
                       (fault_.device == Device::none || fault_.device == device) &&
                       (fault_.code == 0 || fault_.code == code);
  if (!matches || --fault_.countdown > 0) return 0;
  if (!fault_.for_good) armed_ = false;
  ++hits_;
  return fault_.error;
}

}  // namespace virtual_card
