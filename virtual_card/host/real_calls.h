/**
 * @file real_calls.h
 * libc's own definitions of the functions that this library replaces. The card's code calls these and never
 * the plain names, which would lead back into the library.
 *
 * Nothing here allocates, locks, or relies on a constructor: the loader's start-up code and sanitizer
 * runtimes make these calls very early.
 */
#ifndef VIRTUAL_CARD_REAL_CALLS_H
#define VIRTUAL_CARD_REAL_CALLS_H

#include <sys/types.h>

#include <cstddef>
#include <cstdint>

namespace virtual_card::real {

/// The spellings of the replaced calls. A call goes to libc's definition of the same spelling.
enum class Name : std::uint8_t {
  open,
  open64,
  openat,
  openat64,
  open_2,
  open64_2,
  openat_2,
  openat64_2,
  close,
  close_range,
  closefrom,
  ioctl,
  read,
  read_chk,
  mmap,
  mmap64,
  munmap,
  dup,
  dup2,
  dup3,
  fcntl,
  fcntl64,
  count
};

int open(Name spelling, const char *path, int flags, mode_t mode);
int openat(Name spelling, int directory, const char *path, int flags, mode_t mode);
int close(int fd);
int close_range(unsigned first, unsigned last, int flags);
void closefrom(int first);
int ioctl(int fd, unsigned long code, void *argument);
ssize_t read(int fd, void *buffer, std::size_t count);
ssize_t read_chk(int fd, void *buffer, std::size_t count, std::size_t buffer_size);
void *mmap(Name spelling, void *address, std::size_t length, int protection, int flags, int fd, off_t offset);
int munmap(void *address, std::size_t length);
int dup(int fd);
int dup2(int fd, int to);
int dup3(int fd, int to, int flags);
int fcntl(Name spelling, int fd, int command, void *argument);

}  // namespace virtual_card::real

#endif
