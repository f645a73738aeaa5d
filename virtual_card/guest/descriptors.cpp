// The tables of the card's descriptors and mappings.
#include "descriptors.h"

#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <mutex>
#include <new>
#include <vector>

namespace virtual_card::descriptors {
namespace {

constexpr std::uint8_t kForeign = 0;
constexpr std::uint8_t kOrphan = 0xFF;

std::uint8_t mark_of(Device device) {
  return static_cast<std::uint8_t>(static_cast<int>(device) + 1);
}

constinit std::array<std::atomic<std::uint8_t>, kTableSize> marks{};  // kForeign, kOrphan or device + 1
constinit std::array<std::atomic<int>, 4> open_counts{};              // by device: open descriptors
constinit std::atomic<pid_t> home{0};                                 // the process that the card belongs to

struct Mapping {
  std::uintptr_t start;
  std::uintptr_t end;
  Device device;
};
constinit std::mutex mapping_mutex;           // guards mapping_list
constinit std::atomic<int> mapping_count{0};  // length of mapping_list, read without the lock
std::vector<Mapping> &mapping_list() {
  static auto *const list = new std::vector<Mapping>;  // never freed: the host's destructors may still unmap
  return *list;
}

std::atomic<std::uint8_t> *mark(int fd) {
  return fd >= 0 && static_cast<std::size_t>(fd) < kTableSize ? &marks[static_cast<std::size_t>(fd)]
                                                              : nullptr;
}

Owner owner_of(std::uint8_t value) {
  if (value == kForeign || !at_home()) return {};
  return {true, value == kOrphan ? Device::none : static_cast<Device>(value - 1)};
}

constexpr std::uintptr_t kPage = 4096;
std::uintptr_t end_of(const void *address, std::size_t length) {
  return (reinterpret_cast<std::uintptr_t>(address) + length + kPage - 1) & ~(kPage - 1);
}

bool set(int fd, std::uint8_t value) {
  auto *entry = mark(fd);
  if (entry != nullptr) entry->store(value, std::memory_order_relaxed);
  return entry != nullptr;
}

}  // namespace

bool at_home() {
  return home.load(std::memory_order_relaxed) == getpid();
}

void settle() {
  home = getpid();
}

Owner owner(int fd) {
  const auto *entry = mark(fd);
  return entry == nullptr ? Owner{} : owner_of(entry->load(std::memory_order_relaxed));
}

bool add(int fd, Device device) {
  if (!set(fd, device == Device::none ? kOrphan : mark_of(device))) return false;
  if (device != Device::none) ++open_counts[static_cast<std::size_t>(device)];
  return true;
}

Owner remove(int fd) {
  auto *entry = mark(fd);
  if (entry == nullptr) return {};
  const Owner was = owner_of(entry->exchange(kForeign, std::memory_order_relaxed));
  if (was.ours && was.device != Device::none) --open_counts[static_cast<std::size_t>(was.device)];
  return was;
}

int find(Device device) {
  if (open_counts[static_cast<std::size_t>(device)] == 0) return -1;
  const std::uint8_t wanted = mark_of(device);
  for (std::size_t fd = 0; fd < kTableSize; ++fd)
    if (marks[fd].load(std::memory_order_relaxed) == wanted) return static_cast<int>(fd);
  return -1;
}

bool add_mapping(void *address, std::size_t length, Device device) {
  const std::lock_guard lock(mapping_mutex);
  try {
    mapping_list().push_back({reinterpret_cast<std::uintptr_t>(address), end_of(address, length), device});
  } catch (const std::bad_alloc &) {
    return false;
  }
  ++mapping_count;
  return true;
}

std::optional<Device> mapping(const void *address, std::size_t length) {
  if (mapping_count == 0 || !at_home()) return {};
  const auto start = reinterpret_cast<std::uintptr_t>(address);
  const std::uintptr_t end = end_of(address, length);
  const std::lock_guard lock(mapping_mutex);
  for (const Mapping &entry : mapping_list())
    if (entry.start < end && start < entry.end) return entry.device;
  return {};
}

int remove_mappings(const void *address, std::size_t length) {
  const auto start = reinterpret_cast<std::uintptr_t>(address);
  const std::uintptr_t end = end_of(address, length);
  const std::lock_guard lock(mapping_mutex);
  const auto removed = std::erase_if(
      mapping_list(), [&](const Mapping &entry) { return start <= entry.start && entry.end <= end; });
  mapping_count -= static_cast<int>(removed);
  return static_cast<int>(removed);
}

void before_fork() {
  mapping_mutex.lock();
}

void after_fork(bool child) {
  if (child) {
    settle();
    mapping_list().clear();
    mapping_count = 0;
    for (auto &count : open_counts) count = 0;
    for (auto &entry : marks) {
      if (entry.load(std::memory_order_relaxed) != kForeign) entry.store(kOrphan, std::memory_order_relaxed);
    }
  }
  mapping_mutex.unlock();
}

}  // namespace virtual_card::descriptors
