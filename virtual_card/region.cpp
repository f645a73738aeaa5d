#include "region.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

#include "real_calls.h"

namespace virtual_card {

long Region::create() {
  const std::lock_guard lock(mutex_);
  if (fd_ >= 0) return 0;
  const int fd = ::memfd_create(name_, MFD_CLOEXEC);
  if (fd < 0) return -errno;
  void *memory = nullptr;
  if (size_ > 0) {
    memory = MAP_FAILED;
    if (::ftruncate(fd, static_cast<off_t>(size_)) == 0)
      memory = real::mmap(real::Name::mmap, nullptr, size_, PROT_READ | PROT_WRITE, MAP_SHARED, fd, 0);
    if (memory == MAP_FAILED) {
      const int error = errno;
      real::close(fd);
      return -error;
    }
  }
  fd_ = fd;
  memory_ = static_cast<u8 *>(memory);
  return 0;
}

void Region::release() {
  const std::lock_guard lock(mutex_);
  if (memory_ != nullptr) real::munmap(memory_, size_);
  if (fd_ >= 0) real::close(fd_);
  memory_ = nullptr;
  fd_ = -1;
}

long Region::duplicate(bool close_on_exec) {
  const std::lock_guard lock(mutex_);
  const int command = close_on_exec ? F_DUPFD_CLOEXEC : F_DUPFD;
  const int fd = real::fcntl(real::Name::fcntl, fd_, command, nullptr);
  return fd < 0 ? -errno : fd;
}

void Region::write(std::size_t offset, std::span<const u8> bytes, std::size_t end) {
  if (bytes.empty()) return;
  with_bytes([&](std::span<u8> memory) {
    std::memcpy(memory.data() + offset, bytes.data(), std::min(bytes.size(), end - offset));
  });
}

}  // namespace virtual_card
