// Creates, maps and releases the memory that a node shares with the host.
#include "region.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <bit>
#include <cerrno>
#include <cstring>
#include <utility>

#include "host/files.h"
#include "host/message.h"
#include "host/real_calls.h"

namespace virtual_card {
namespace {

int fcntl(int fd, int command, std::intptr_t argument) {
  return real::fcntl(real::Name::fcntl, fd, command, std::bit_cast<void *>(argument));
}

/// Creates a file in memory and seals its size: if the host shrank the file, the card's next access would
/// raise SIGBUS.
int make_file(const char *name, std::size_t size, bool close_on_exec) {
  const unsigned flags = MFD_ALLOW_SEALING | (close_on_exec ? MFD_CLOEXEC : 0u);
  constexpr std::intptr_t kSeals = F_SEAL_SHRINK | F_SEAL_GROW | F_SEAL_SEAL;
  const int fd = ::memfd_create(name, flags);
  if (fd < 0) return -errno;
  const FileLimitFails no_signal;
  if (::ftruncate(fd, static_cast<off_t>(size)) == 0 && fcntl(fd, F_ADD_SEALS, kSeals) == 0) return fd;
  const int error = errno;
  real::close(fd);
  return -error;
}

}  // namespace

long Region::open(int sibling, bool close_on_exec) {
  if (sibling >= 0) {
    const int fd = fcntl(sibling, close_on_exec ? F_DUPFD_CLOEXEC : F_DUPFD, 0);
    return fd < 0 ? -errno : fd;
  }
  release();
  const long fd = make_memory(close_on_exec);
  if (fd < 0)
    print_message(
        "cannot make the memory of /dev/%s, %zu KiB: %s", name_, size_ / 1024,
        fd == -EFBIG ? "the file size limit (ulimit -f) is lower" : std::strerror(static_cast<int>(-fd)));
  return fd;
}

long Region::make_memory(bool close_on_exec) {
  const int fd = make_file(name_, size_, close_on_exec);
  if (fd < 0 || size_ == 0) return fd;
  void *memory = real::mmap(real::Name::mmap, nullptr, size_, PROT_READ | PROT_WRITE, MAP_SHARED, fd, 0);
  if (memory == MAP_FAILED) {
    const int error = errno;
    real::close(fd);
    return -error;
  }
  const std::lock_guard lock(mutex_);
  memory_ = static_cast<u8 *>(memory);
  return fd;
}

void Region::release() {
  const std::lock_guard lock(mutex_);
  if (memory_ != nullptr) real::munmap(std::exchange(memory_, nullptr), size_);
}

void Region::write(std::size_t offset, std::span<const u8> bytes, std::size_t end) {
  if (bytes.empty()) return;
  with_bytes([&](std::span<u8> memory) {
    std::memcpy(memory.data() + offset, bytes.data(), std::min(bytes.size(), end - offset));
  });
}

}  // namespace virtual_card
