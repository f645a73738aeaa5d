#ifndef VIRTUAL_CARD_REGION_H
#define VIRTUAL_CARD_REGION_H

#include <mutex>
#include <span>

#include "card_state.h"

namespace virtual_card {

/// Memory the card shares with the host: the file behind the descriptors of a node, and the card's
/// own mapping of it.
class Region {
 public:
  Region(const char *name, std::size_t size) : name_(name), size_(size) {}
  ~Region() { release(); }
  Region(const Region &) = delete;
  Region &operator=(const Region &) = delete;

  /// Makes the memory, all zeros, unless it is there. 0 or a negated error number.
  long create();
  void release();
  /// Another descriptor of the memory, for the host. A negated error number when there is none.
  long duplicate(bool close_on_exec);
  std::size_t size() const { return size_; }

  /// Copies bytes to an offset, as many as fit before `end`.
  void write(std::size_t offset, std::span<const u8> bytes, std::size_t end);
  /// Calls `use` with the memory, if it is there.
  template <typename Use>
  void with_bytes(Use use) {
    const std::lock_guard lock(mutex_);
    if (memory_ != nullptr) use(std::span<u8>(memory_, size_));
  }

 private:
  const char *name_;
  std::size_t size_;
  std::mutex mutex_;  // guards fd_ and memory_: the last close must not pull the memory away from a read
  int fd_ = -1;
  u8 *memory_ = nullptr;
};

}  // namespace virtual_card

#endif
