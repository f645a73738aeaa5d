#include "region.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <bit>
#include <cerrno>
#include <cstring>

#include "descriptors.h"
#include "real_calls.h"

namespace virtual_card {
namespace {

/// Numbers below are the host's, which may count on getting or choosing them.
constexpr std::intptr_t kFirstInner = 900;

long fcntl(int fd, int command, std::intptr_t argument) {
  const int result = real::fcntl(real::Name::fcntl, fd, command, std::bit_cast<void *>(argument));
  return result < 0 ? -errno : result;
}

/// Moves a new descriptor out of the host's way and marks it. It may stay where the limit is too low.
int hide(int fd) {
  if (const long moved = fcntl(fd, F_DUPFD_CLOEXEC, kFirstInner); moved >= 0) {
    real::close(fd);
    fd = static_cast<int>(moved);
  }
  descriptors::add_inner(fd);
  return fd;
}

/// A file whose size nobody can change: memory behind a mapping that goes away kills its user.
int make_file(const char *name, std::size_t size) {
  const int fd = ::memfd_create(name, MFD_CLOEXEC | MFD_ALLOW_SEALING);
  constexpr std::intptr_t kSeals = F_SEAL_SHRINK | F_SEAL_GROW | F_SEAL_SEAL;
  if (fd < 0) return fd;
  if (::ftruncate(fd, static_cast<off_t>(size)) == 0 && fcntl(fd, F_ADD_SEALS, kSeals) == 0) return fd;
  const int error = errno;
  real::close(fd);
  errno = error;
  return -1;
}

}  // namespace

long Region::create() {
  const std::lock_guard lock(mutex_);
  if (fd_ >= 0) return 0;
  const int fd = make_file(name_, size_);
  if (fd < 0) return -errno;
  void *memory = nullptr;
  if (size_ > 0)
    memory = real::mmap(real::Name::mmap, nullptr, size_, PROT_READ | PROT_WRITE, MAP_SHARED, fd, 0);
  if (memory == MAP_FAILED) {
    const int error = errno;
    real::close(fd);
    return -error;
  }
  fd_ = hide(fd);
  memory_ = static_cast<u8 *>(memory);
  return 0;
}

void Region::release() {
  const std::lock_guard lock(mutex_);
  if (memory_ != nullptr) real::munmap(memory_, size_);
  if (fd_ >= 0) {
    descriptors::remove(fd_);
    real::close(fd_);
  }
  memory_ = nullptr;
  fd_ = -1;
}

long Region::duplicate(bool close_on_exec) {
  const std::lock_guard lock(mutex_);
  return fcntl(fd_, close_on_exec ? F_DUPFD_CLOEXEC : F_DUPFD, 0);
}

void Region::write(std::size_t offset, std::span<const u8> bytes, std::size_t end) {
  if (bytes.empty()) return;
  with_bytes([&](std::span<u8> memory) {
    std::memcpy(memory.data() + offset, bytes.data(), std::min(bytes.size(), end - offset));
  });
}

}  // namespace virtual_card
