/**
 * @file region.h
 * The memory that a device node shares with the host.
 */
#ifndef VIRTUAL_CARD_REGION_H
#define VIRTUAL_CARD_REGION_H

#include <mutex>
#include <span>

#include "card_state.h"

namespace virtual_card {

/// The memory of one node, as a file in memory. The host's descriptors of the node are descriptors of that
/// file; the card keeps a mapping of the file and no descriptor.
class Region {
 public:
  Region(const char *name, std::size_t size) : name_(name), size_(size) {}
  ~Region() { release(); }
  Region(const Region &) = delete;
  Region &operator=(const Region &) = delete;

  /// Returns a new descriptor for the host, or a negated error number. `sibling` is an open descriptor of the
  /// node, or -1: then the memory is new and all zeros. If it cannot be made, a line on standard error says
  /// why.
  long open(int sibling, bool close_on_exec);
  /// Removes the card's mapping. The host's mappings stay valid.
  void release();
  std::size_t size() const { return size_; }

  /// Copies bytes to an offset, as many as fit before `end`.
  void write(std::size_t offset, std::span<const u8> bytes, std::size_t end);
  /// Calls `use` with the memory if the card has it mapped.
  template <typename Use>
  void with_bytes(Use use) {
    const std::lock_guard lock(mutex_);
    if (memory_ != nullptr) use(std::span<u8>(memory_, size_));
  }

 private:
  long make_memory(bool close_on_exec);

  const char *name_;
  std::size_t size_;
  std::mutex mutex_;  // guards memory_: the last close must not unmap it during a read
  u8 *memory_ = nullptr;
};

}  // namespace virtual_card

#endif
