// Looks up and calls libc's own definitions of the names that this library replaces.
#include "real_calls.h"

#include <dlfcn.h>

#include <array>
#include <atomic>
#include <cerrno>

namespace virtual_card::real {
namespace {

constexpr std::size_t kNames = static_cast<std::size_t>(Name::count);

constexpr std::array<const char *, kNames> kSymbols = {
    "open",   "open64",      "openat",    "openat64", "__open_2", "__open64_2", "__openat_2", "__openat64_2",
    "close",  "close_range", "closefrom", "ioctl",    "read",     "__read_chk", "mmap",       "mmap64",
    "munmap", "dup",         "dup2",      "dup3",     "fcntl",    "fcntl64"};

constinit std::array<std::atomic<void *>, kNames> addresses{};  // libc's definition of each name

template <typename Function>
Function *next(Name name) {
  const auto index = static_cast<std::size_t>(name);
  void *address = addresses[index].load(std::memory_order_relaxed);
  if (address == nullptr) {
    const int before = errno;
    address = dlsym(RTLD_NEXT, kSymbols[index]);
    addresses[index].store(address, std::memory_order_relaxed);
    errno = before;
  }
  return reinterpret_cast<Function *>(address);
}

template <typename Function, typename... Arguments>
auto call(Name name, Arguments... arguments) -> decltype(next<Function>(name)(arguments...)) {
  Function *function = next<Function>(name);
  if (function == nullptr) {
    errno = ENOSYS;
    return decltype(function(arguments...))(-1);  // also MAP_FAILED NOLINT(performance-no-int-to-ptr)
  }
  return function(arguments...);
}

}  // namespace

int open(Name spelling, const char *path, int flags, mode_t mode) {
  if (spelling == Name::open_2 || spelling == Name::open64_2)
    return call<int(const char *, int)>(spelling, path, flags);
  return call<int(const char *, int, ...)>(spelling, path, flags, mode);
}

int openat(Name spelling, int directory, const char *path, int flags, mode_t mode) {
  if (spelling == Name::openat_2 || spelling == Name::openat64_2)
    return call<int(int, const char *, int)>(spelling, directory, path, flags);
  return call<int(int, const char *, int, ...)>(spelling, directory, path, flags, mode);
}

int close(int fd) {
  return call<int(int)>(Name::close, fd);
}

int close_range(unsigned first, unsigned last, int flags) {
  return call<int(unsigned, unsigned, int)>(Name::close_range, first, last, flags);
}

void closefrom(int first) {
  if (auto *function = next<void(int)>(Name::closefrom)) function(first);
}

int ioctl(int fd, unsigned long code, void *argument) {
  return call<int(int, unsigned long, ...)>(Name::ioctl, fd, code, argument);
}

ssize_t read(int fd, void *buffer, std::size_t count) {
  return call<ssize_t(int, void *, std::size_t)>(Name::read, fd, buffer, count);
}

ssize_t read_chk(int fd, void *buffer, std::size_t count, std::size_t buffer_size) {
  return call<ssize_t(int, void *, std::size_t, std::size_t)>(Name::read_chk, fd, buffer, count, buffer_size);
}

void *mmap(Name spelling, void *address, std::size_t length, int protection, int flags, int fd,
           off_t offset) {
  return call<void *(void *, std::size_t, int, int, int, off_t)>(spelling, address, length, protection, flags,
                                                                 fd, offset);
}

int munmap(void *address, std::size_t length) {
  return call<int(void *, std::size_t)>(Name::munmap, address, length);
}

int dup(int fd) {
  return call<int(int)>(Name::dup, fd);
}

int dup2(int fd, int to) {
  return call<int(int, int)>(Name::dup2, fd, to);
}

int dup3(int fd, int to, int flags) {
  return call<int(int, int, int)>(Name::dup3, fd, to, flags);
}

int fcntl(Name spelling, int fd, int command, void *argument) {
  return call<int(int, int, ...)>(spelling, fd, command, argument);
}

}  // namespace virtual_card::real
