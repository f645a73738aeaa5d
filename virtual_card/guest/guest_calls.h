/**
 * @file guest_calls.h
 * Handles the libc calls of the host program: a call on a device node goes to the card, every other call
 * goes to libc unchanged. errno changes only on failure.
 */
#ifndef VIRTUAL_CARD_GUEST_CALLS_H
#define VIRTUAL_CARD_GUEST_CALLS_H

#include "host/real_calls.h"

namespace virtual_card::guest {

int open(real::Name spelling, const char *path, int flags, mode_t mode);
int openat(real::Name spelling, int directory, const char *path, int flags, mode_t mode);
int close(int fd);
int close_range(unsigned first, unsigned last, int flags);
void closefrom(int first);
int ioctl(int fd, unsigned long code, void *argument);
ssize_t read(int fd, void *buffer, std::size_t count);
ssize_t read_chk(int fd, void *buffer, std::size_t count, std::size_t buffer_size);
void *mmap(real::Name spelling, void *address, std::size_t length, int protection, int flags, int fd,
           off_t offset);
int munmap(void *address, std::size_t length);
int dup(int fd);
int dup2(int fd, int to);
int dup3(int fd, int to, int flags);
int fcntl(real::Name spelling, int fd, int command, void *argument);

}  // namespace virtual_card::guest

#endif
