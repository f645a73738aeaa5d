// Creates and writes regular files.
#include "files.h"

#include <fcntl.h>
#include <pthread.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <ctime>

#include "real_calls.h"

namespace virtual_card {

FileLimitFails::FileLimitFails() {
  sigset_t pending{};
  sigpending(&pending);
  pending_before_ = sigismember(&pending, SIGXFSZ) != 0;
  sigaddset(&only_, SIGXFSZ);
  pthread_sigmask(SIG_BLOCK, &only_, &before_);
}

FileLimitFails::~FileLimitFails() {
  const int error = errno;
  const std::timespec at_once{};
  if (!pending_before_) sigtimedwait(&only_, nullptr, &at_once);
  pthread_sigmask(SIG_SETMASK, &before_, nullptr);
  errno = error;
}

long create_file(const std::string &path) {
  constexpr int kFlags = O_WRONLY | O_CREAT | O_NONBLOCK | O_NOCTTY | O_CLOEXEC;
  constexpr mode_t kMode = 0666;
  const int fd = real::open(real::Name::open, path.c_str(), kFlags, kMode);
  if (fd < 0) return errno == ENXIO ? -EINVAL : -errno;  // ENXIO: a pipe that nobody reads
  struct stat status {};
  long error = -EINVAL;
  if (::fstat(fd, &status) == 0 && S_ISREG(status.st_mode)) error = ::ftruncate(fd, 0) == 0 ? 0 : -errno;
  if (error == 0) return fd;
  real::close(fd);
  return error;
}

long write_all(int fd, std::string_view text) {
  const FileLimitFails no_signal;
  while (!text.empty()) {
    const ssize_t written = ::write(fd, text.data(), text.size());
    if (written < 0 && errno != EINTR) return -errno;
    if (written > 0) text.remove_prefix(static_cast<std::size_t>(written));
  }
  return 0;
}

}  // namespace virtual_card
