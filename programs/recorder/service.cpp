// Talks to systemd, and locks the root.
#include "service.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <cerrno>
#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <stdexcept>

namespace recorder {

void notify(const std::string &lines) {
  const char *const path = std::getenv("NOTIFY_SOCKET");
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (path == nullptr || std::strlen(path) >= sizeof address.sun_path) return;
  std::strcpy(address.sun_path, path);
  if (*path == '@') address.sun_path[0] = '\0';  // a name without a file
  const int file = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
  if (file < 0) return;
  const auto size = static_cast<socklen_t>(offsetof(sockaddr_un, sun_path) + std::strlen(path));
  sendto(file, lines.data(), lines.size(), MSG_NOSIGNAL, reinterpret_cast<const sockaddr *>(&address), size);
  close(file);
}

RootLock::RootLock(const std::string &root) : path_(root + "/.zarvo-recorder.lock") {
  const int error = hold();
  if (error == EWOULDBLOCK) throw std::runtime_error("another recorder uses " + root);
  if (error != 0) throw std::runtime_error(path_ + ": " + std::strerror(error));
}

RootLock::~RootLock() {
  if (file_ >= 0) close(file_);
}

int RootLock::hold() {
  struct stat held {
  }, there{};
  if (file_ >= 0 && fstat(file_, &held) == 0 && stat(path_.c_str(), &there) == 0 &&
      held.st_ino == there.st_ino && held.st_dev == there.st_dev)
    return 0;
  const int file = open(path_.c_str(), O_RDWR | O_CREAT | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC, 0666);
  if (file < 0) return errno;
  if (flock(file, LOCK_EX | LOCK_NB) != 0) {
    const int error = errno;
    close(file);
    return error;
  }
  if (file_ >= 0) close(file_);
  file_ = file;
  return 0;
}

}  // namespace recorder
