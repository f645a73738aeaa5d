// Makes calls on the device nodes fail or take long.
#include "call_faults.h"

#include <thread>

namespace virtual_card {

void CallFaults::set(std::vector<std::shared_ptr<CallFault>> faults, std::chrono::milliseconds delay) {
  const std::lock_guard lock(mutex_);
  armed_ = !faults.empty() || delay.count() > 0;
  faults_ = std::move(faults);
  delay_ = delay;
}

int CallFaults::strike(Operation operation, Device device, std::uint32_t code) {
  if (!armed_.load(std::memory_order_relaxed)) return 0;
  int error = 0;
  std::chrono::milliseconds delay;
  {
    const std::lock_guard lock(mutex_);
    delay = delay_;
    for (const auto &fault : faults_) {
      if (operation != fault->operation || (fault->device != Device::none && fault->device != device) ||
          (fault->code != 0 && fault->code != code))
        continue;
      const std::uint64_t number = ++fault->seen;
      if (error != 0 || number <= fault->skip) continue;
      const std::uint64_t after = number - fault->skip;
      if (after % fault->every != 0 || after / fault->every > fault->times) continue;
      error = fault->error;
      ++hits_;
    }
  }
  if (delay.count() > 0) std::this_thread::sleep_for(delay);
  return error;
}

}  // namespace virtual_card
