// The libc functions that this library replaces, in every spelling a compiler can emit. Each only passes
// the call on; guest_calls decides what to do with it.

// With these macros, libc's headers turn the names into inline functions and aliases of each other.
#undef _FORTIFY_SOURCE
#undef _FILE_OFFSET_BITS

#include <fcntl.h>
#include <sys/ioctl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cstdarg>

#include "guest_calls.h"

#define EXPORTED extern "C" __attribute__((visibility("default")))

/// Reads the argument behind `last`. The caller may have left it out; libc reads it in the same way.
#define OPTIONAL(last, type)               \
  __extension__({                          \
    va_list list;                          \
    va_start(list, last);                  \
    const auto value = va_arg(list, type); \
    va_end(list);                          \
    value;                                 \
  })
/// Reads the mode of an open call, which exists only if the flags allow creating a file.
#define MODE(flags) ((flags) & (O_CREAT | O_TMPFILE) ? OPTIONAL(flags, mode_t) : mode_t{0})

// Names that no header declares.
EXPORTED int __open_2(const char *path, int flags);
EXPORTED int __open64_2(const char *path, int flags);
EXPORTED int __openat_2(int directory, const char *path, int flags);
EXPORTED int __openat64_2(int directory, const char *path, int flags);
EXPORTED ssize_t __read_chk(int fd, void *buffer, size_t count, size_t buffer_size);

namespace guest = virtual_card::guest;
using virtual_card::real::Name;

EXPORTED int open(const char *path, int flags, ...) {
  return guest::open(Name::open, path, flags, MODE(flags));
}
EXPORTED int open64(const char *path, int flags, ...) {
  return guest::open(Name::open64, path, flags, MODE(flags));
}
EXPORTED int openat(int directory, const char *path, int flags, ...) {
  return guest::openat(Name::openat, directory, path, flags, MODE(flags));
}
EXPORTED int openat64(int directory, const char *path, int flags, ...) {
  return guest::openat(Name::openat64, directory, path, flags, MODE(flags));
}
EXPORTED int __open_2(const char *path, int flags) {
  return guest::open(Name::open_2, path, flags, 0);
}
EXPORTED int __open64_2(const char *path, int flags) {
  return guest::open(Name::open64_2, path, flags, 0);
}
EXPORTED int __openat_2(int directory, const char *path, int flags) {
  return guest::openat(Name::openat_2, directory, path, flags, 0);
}
EXPORTED int __openat64_2(int directory, const char *path, int flags) {
  return guest::openat(Name::openat64_2, directory, path, flags, 0);
}
EXPORTED int close(int fd) {
  return guest::close(fd);
}
EXPORTED int close_range(unsigned first, unsigned last, int flags) noexcept {
  return guest::close_range(first, last, flags);
}
EXPORTED void closefrom(int first) noexcept {
  guest::closefrom(first);
}
EXPORTED int ioctl(int fd, unsigned long code, ...) noexcept {
  return guest::ioctl(fd, code, OPTIONAL(code, void *));
}
EXPORTED ssize_t read(int fd, void *buffer, size_t count) {
  return guest::read(fd, buffer, count);
}
EXPORTED ssize_t __read_chk(int fd, void *buffer, size_t count, size_t buffer_size) {
  return guest::read_chk(fd, buffer, count, buffer_size);
}
EXPORTED void *mmap(void *address, size_t length, int protection, int flags, int fd, off_t offset) noexcept {
  return guest::mmap(Name::mmap, address, length, protection, flags, fd, offset);
}
EXPORTED void *mmap64(void *address, size_t length, int protection, int flags, int fd,
                      off64_t offset) noexcept {
  return guest::mmap(Name::mmap64, address, length, protection, flags, fd, offset);
}
EXPORTED int munmap(void *address, size_t length) noexcept {
  return guest::munmap(address, length);
}
EXPORTED int dup(int fd) noexcept {
  return guest::dup(fd);
}
EXPORTED int dup2(int fd, int to) noexcept {
  return guest::dup2(fd, to);
}
EXPORTED int dup3(int fd, int to, int flags) noexcept {
  return guest::dup3(fd, to, flags);
}
EXPORTED int fcntl(int fd, int command, ...) {
  return guest::fcntl(Name::fcntl, fd, command, OPTIONAL(command, void *));
}
EXPORTED int fcntl64(int fd, int command, ...) {
  return guest::fcntl(Name::fcntl64, fd, command, OPTIONAL(command, void *));
}
