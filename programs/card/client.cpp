// Sends a request to the virtual card's control socket and reads the answer.
#include "client.h"

#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

namespace card {
namespace {

class Connection {
 public:
  ~Connection() {
    if (fd_ >= 0) close(fd_);
  }
  bool open(const std::string &path) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    if (path.size() >= sizeof address.sun_path) {
      errno = ENAMETOOLONG;
      return false;
    }
    std::memcpy(address.sun_path, path.c_str(), path.size() + 1);
    fd_ = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    return fd_ >= 0 && connect(fd_, reinterpret_cast<const sockaddr *>(&address), sizeof address) == 0;
  }
  bool send_all(const std::string &text) const {
    std::size_t sent = 0;
    while (sent < text.size()) {
      const ssize_t size = send(fd_, text.data() + sent, text.size() - sent, MSG_NOSIGNAL);
      if (size < 0) return false;
      sent += static_cast<std::size_t>(size);
    }
    return true;
  }
  /// Returns the next piece of the answer; empty at the end.
  std::string receive() const {
    char bytes[1 << 16];
    const ssize_t size = recv(fd_, bytes, sizeof bytes, 0);
    return size > 0 ? std::string(bytes, static_cast<std::size_t>(size)) : std::string{};
  }

 private:
  int fd_ = -1;
};

}  // namespace

std::string ask(const std::string &socket, const std::string &request,
                const std::function<void(const std::string &piece)> &take) {
  Connection connection;
  if (!connection.open(socket) || !connection.send_all(request + "\n"))
    return "cannot reach the card at " + socket + ": " + std::strerror(errno);

  std::string head;
  while (head.find('\n') == std::string::npos) {
    const std::string piece = connection.receive();
    if (piece.empty()) return "the card has closed the connection";
    head += piece;
  }
  const std::string status = head.substr(0, head.find('\n'));
  if (status != "ok") return status.substr(status.find(' ') + 1);
  std::string piece = head.substr(status.size() + 1);
  do {
    if (!piece.empty()) take(piece);
    piece = connection.receive();
  } while (!piece.empty());
  return {};
}

}  // namespace card
