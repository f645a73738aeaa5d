// Audio reads.
#include "device_audio.h"

#include <algorithm>
#include <cerrno>

#include "host/user_memory.h"

namespace virtual_card {

long AudioDevice::read(std::uintptr_t buffer, std::size_t count) {
  constexpr std::size_t kBlocks = driver::kAudioReadCount * driver::kAudioBlockSize;
  if (count != driver::kAudioReadCount) return -EINVAL;
  long error = 0;
  const long result = board_.audio.read(
      board_.encoding, board_.read_wait(), [&] { return board_.clock.now(); },
      [&](std::span<const u8> area) {
        error = copy_to_user(buffer, area.data(), std::min(area.size(), kBlocks));
      });
  return error != 0 ? error : result;
}

}  // namespace virtual_card
