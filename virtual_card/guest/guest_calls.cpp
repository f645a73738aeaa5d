// Decides for each libc call of the host program whether the card or libc handles it.
#include "guest_calls.h"

#include <fcntl.h>
#include <linux/close_range.h>
#include <pthread.h>
#include <sys/mman.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <exception>
#include <mutex>
#include <new>
#include <string_view>
#include <system_error>
#include <utility>

#include "descriptors.h"
#include "nodes/card.h"
#include "preload.h"

namespace virtual_card::guest {
namespace {

using descriptors::owner;
using descriptors::Owner;

bool is_node(const char *path) {
  constexpr std::string_view kPrefix = driver::kNodePrefix;
  return path != nullptr && std::strncmp(path, kPrefix.data(), kPrefix.size()) == 0;
}

/// Runs a call of the card. A negated error number goes into errno, and the call returns -1. Results below
/// -kMaxError are returned unchanged, as libc does.
template <typename Function>
long answer(Function call) {
  const int before = errno;
  long result = 0;
  try {
    result = call();
  } catch (const std::bad_alloc &) {
    result = -ENOMEM;
  } catch (const std::system_error &error) {
    result = -error.code().value();
  } catch (const std::exception &) {
    result = -EIO;
  }
  if (result < 0 && result >= -kMaxError) {
    errno = static_cast<int>(-result);
    return -1;
  }
  errno = before;
  return result;
}

/// Held while a descriptor of a node is opened, copied or closed: while open() copies a descriptor, no other
/// thread may close it and reuse its number.
constinit std::mutex node_mutex;
constinit bool left_preload_list = false;  // guarded by node_mutex

int open_node(const char *path, int flags) {
  return static_cast<int>(answer([&]() -> long {
    if (!descriptors::at_home()) return -ENODEV;
    const Device device = device_of(path);
    Card &card = Card::instance();
    const std::lock_guard lock(node_mutex);
    if (!std::exchange(left_preload_list, true)) leave_preload_list();
    const int sibling = device == Device::none ? -1 : descriptors::find(device);
    const long fd = card.open(device, flags, sibling);
    if (fd < 0) return fd;
    if (descriptors::add(static_cast<int>(fd), device)) return fd;
    real::close(static_cast<int>(fd));
    card.closed();
    return -EMFILE;
  }));
}

/// Runs a call on a node's descriptor. A descriptor inherited through fork gets ENODEV.
template <typename Function>
long answer_for(const Owner &node, Function call) {
  return answer([&]() -> long { return node.device == Device::none ? -ENODEV : call(Card::instance()); });
}

/// Closes a node's descriptor. Removes the number from the table first: after close() another thread may get
/// the same number.
long close_node(int fd) {
  const std::lock_guard lock(node_mutex);
  const Owner was = descriptors::remove(fd);
  if (was.device == Device::none) return real::close(fd) == 0 ? 0 : -errno;
  const long result = Card::instance().close(was.device);
  const long error = real::close(fd) == 0 ? 0 : -errno;
  Card::instance().closed();
  return error != 0 ? error : result;
}

/// Records `fd` as another descriptor of the node of `source`.
int duplicated(const Owner &source, int fd) {
  if (fd < 0 || !source.ours) return fd;
  if (source.device != Device::none) Card::instance().duplicated();
  if (descriptors::add(fd, source.device)) return fd;
  real::close(fd);
  if (source.device != Device::none) Card::instance().closed();
  errno = EMFILE;
  return -1;
}

/// Records that dup2 or dup3 has replaced a descriptor of a node.
void replaced(const Owner &target, int fd, int result) {
  if (result < 0 || !target.ours) return;
  descriptors::remove(fd);
  if (target.device != Device::none) Card::instance().closed();
}

/// Closes the nodes' descriptors in a range, before close_range() or closefrom() closes the whole range.
void close_nodes(unsigned first, unsigned last) {
  for (unsigned fd = first; fd <= last && fd < descriptors::kTableSize; ++fd)
    if (owner(static_cast<int>(fd)).ours) guest::close(static_cast<int>(fd));
}

struct AtLoad {
  AtLoad() {
    descriptors::settle();
    pthread_atfork(
        [] {
          node_mutex.lock();
          Card::before_fork();
          descriptors::before_fork();
        },
        [] {
          descriptors::after_fork(false);
          Card::after_fork(false);
          node_mutex.unlock();
        },
        [] {
          descriptors::after_fork(true);
          Card::after_fork(true);
          node_mutex.unlock();
        });
  }
};
const AtLoad at_load;

}  // namespace

int open(real::Name spelling, const char *path, int flags, mode_t mode) {
  return is_node(path) ? open_node(path, flags) : real::open(spelling, path, flags, mode);
}

int openat(real::Name spelling, int directory, const char *path, int flags, mode_t mode) {
  return is_node(path) ? open_node(path, flags) : real::openat(spelling, directory, path, flags, mode);
}

int close(int fd) {
  const Owner node = owner(fd);
  if (!node.ours) return real::close(fd);
  return static_cast<int>(answer([&] { return close_node(fd); }));
}

int close_range(unsigned first, unsigned last, int flags) {
  if ((static_cast<unsigned>(flags) & CLOSE_RANGE_CLOEXEC) == 0) close_nodes(first, last);
  return real::close_range(first, last, flags);
}

void closefrom(int first) {
  close_nodes(static_cast<unsigned>(std::max(first, 0)), descriptors::kTableSize);
  real::closefrom(first);
}

int ioctl(int fd, unsigned long code, void *argument) {
  const Owner node = owner(fd);
  if (!node.ours) return real::ioctl(fd, code, argument);
  return static_cast<int>(answer_for(node, [&](Card &card) {
    return card.ioctl(node.device, static_cast<u32>(code), reinterpret_cast<std::uintptr_t>(argument));
  }));
}

ssize_t read(int fd, void *buffer, std::size_t count) {
  const Owner node = owner(fd);
  if (!node.ours) return real::read(fd, buffer, count);
  return answer_for(node, [&](Card &card) {
    return card.read(node.device, reinterpret_cast<std::uintptr_t>(buffer), count);
  });
}

ssize_t read_chk(int fd, void *buffer, std::size_t count, std::size_t buffer_size) {
  return owner(fd).ours ? read(fd, buffer, count) : real::read_chk(fd, buffer, count, buffer_size);
}

void *mmap(real::Name spelling, void *address, std::size_t length, int protection, int flags, int fd,
           off_t offset) {
  const Owner node = (flags & MAP_ANONYMOUS) != 0 ? Owner{} : owner(fd);
  if (!node.ours) return real::mmap(spelling, address, length, protection, flags, fd, offset);
  void *mapped = MAP_FAILED;
  answer_for(node, [&](Card &card) -> long {
    const MapRequest request{address, length, protection, flags, offset};
    const long result = card.mmap(node.device, fd, request, mapped);
    if (result != 0 || descriptors::add_mapping(mapped, length, node.device)) return result;
    real::munmap(std::exchange(mapped, MAP_FAILED), length);
    card.unmapped(1);
    return -ENOMEM;
  });
  return mapped;
}

int munmap(void *address, std::size_t length) {
  const auto device = descriptors::mapping(address, length);
  if (!device) return real::munmap(address, length);
  return static_cast<int>(answer([&]() -> long {
    if (const long fault = Card::instance().munmap(*device, length); fault < 0) return fault;
    if (real::munmap(address, length) != 0) return -errno;
    Card::instance().unmapped(descriptors::remove_mappings(address, length));
    return 0;
  }));
}

int dup(int fd) {
  if (!owner(fd).ours) return real::dup(fd);
  const std::lock_guard lock(node_mutex);
  return duplicated(owner(fd), real::dup(fd));
}

/// Does dup2 or dup3 when either of the two descriptors may be a node's.
template <typename Function>
int duplicate_to(int fd, int to, Function call) {
  if (fd == to || (!owner(fd).ours && !owner(to).ours)) return call();
  const std::lock_guard lock(node_mutex);
  const Owner source = owner(fd);
  const Owner target = owner(to);
  const int result = call();
  replaced(target, to, result);
  return duplicated(source, result);
}

int dup2(int fd, int to) {
  return duplicate_to(fd, to, [=] { return real::dup2(fd, to); });
}

int dup3(int fd, int to, int flags) {
  return duplicate_to(fd, to, [=] { return real::dup3(fd, to, flags); });
}

int fcntl(real::Name spelling, int fd, int command, void *argument) {
  const bool duplicates = command == F_DUPFD || command == F_DUPFD_CLOEXEC;
  if (!duplicates || !owner(fd).ours) return real::fcntl(spelling, fd, command, argument);
  const std::lock_guard lock(node_mutex);
  return duplicated(owner(fd), real::fcntl(spelling, fd, command, argument));
}

}  // namespace virtual_card::guest
