// Serves the control socket.
#include "control_server.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <new>
#include <system_error>
#include <vector>

#include "commands.h"
#include "host/real_calls.h"
#include "host/threads.h"
#include "item_values.h"

namespace virtual_card {
namespace {

constexpr std::size_t kMaxRequest = 64u << 10;
constexpr std::size_t kMaxBacklog = 256u << 10;  // bytes of the log that wait for a client
constexpr std::size_t kMaxClients = 16;
constexpr mode_t kOwnerOnly = 0600;

std::string refused(const std::string &path, const char *reason) {
  return "item \"control\": cannot listen on " + path + ": " + reason;
}

/// Removes a socket that nobody listens on. Returns an empty text, or why the path cannot be used.
std::string clear_stale(int socket, const sockaddr_un &address) {
  struct stat found {};
  if (lstat(address.sun_path, &found) != 0) return {};
  if (!S_ISSOCK(found.st_mode)) return "it exists and is no socket";
  if (connect(socket, reinterpret_cast<const sockaddr *>(&address), sizeof address) == 0)
    return "another program listens there";
  if (errno != ECONNREFUSED || unlink(address.sun_path) != 0) return std::strerror(errno);
  return {};
}

int new_socket() {
  return socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
}

}  // namespace

std::string ControlServer::start(const std::string &path) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (path.size() >= sizeof address.sun_path) return refused(path, "the path is too long");
  std::memcpy(address.sun_path, path.c_str(), path.size() + 1);

  const int probe = new_socket();
  const std::string stale = clear_stale(probe, address);
  real::close(probe);
  if (!stale.empty()) return refused(path, stale.c_str());

  listener_ = new_socket();
  wake_ = eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
  // The mode of the socket before bind() becomes the mode of the file.
  const bool listens = listener_ >= 0 && wake_ >= 0 && fchmod(listener_, kOwnerOnly) == 0 &&
                       bind(listener_, reinterpret_cast<const sockaddr *>(&address), sizeof address) == 0;
  if (listens) path_ = path;
  if (!listens || listen(listener_, kMaxClients) != 0) {
    std::string error = refused(path, std::strerror(errno));
    stop();
    return error;
  }
  try {
    ending_ = false;
    thread_ = start_thread([this] { loop(); });
  } catch (const std::exception &) {
    stop();
    return refused(path, "cannot create a thread");
  }
  return {};
}

void ControlServer::stop() {
  ending_ = true;
  wake();
  if (thread_.joinable()) thread_.join();
  for (int *fd : {&listener_, &wake_}) {
    if (*fd >= 0) real::close(*fd);
    *fd = -1;
  }
  if (!path_.empty()) unlink(path_.c_str());
  path_.clear();
}

void ControlServer::wake() const {
  const std::uint64_t one = 1;
  if (wake_ >= 0 && write(wake_, &one, sizeof one) < 0)
    return;  // the counter is full: the thread wakes anyway
}

void ControlServer::loop() {
  while (!ending_) {
    std::vector<pollfd> waits{{listener_, POLLIN, 0}, {wake_, POLLIN, 0}};
    {
      const std::lock_guard lock(mutex_);
      for (const Client &client : clients_)
        waits.push_back(
            {client.fd, static_cast<short>(client.answer.empty() ? POLLIN : POLLIN | POLLOUT), 0});
    }
    poll(waits.data(), waits.size(), -1);
    std::uint64_t count = 0;
    if (real::read(wake_, &count, sizeof count) < 0 && errno != EAGAIN) return;

    auto client = clients_.begin();
    for (std::size_t n = 2; n < waits.size(); ++n) {
      const bool open = ((waits[n].revents & (POLLIN | POLLHUP | POLLERR)) == 0 || receive(*client)) &&
                        send_answer(*client);
      const auto done = client++;
      if (!open) drop(done);
    }
    if ((waits[0].revents & POLLIN) != 0) accept_client();
  }
  log_.listen({});
  for (const Client &client : clients_) real::close(client.fd);
  clients_.clear();
}

void ControlServer::drop(std::list<Client>::iterator client) {
  real::close(client->fd);
  bool watched = false;
  {
    const std::lock_guard lock(mutex_);
    clients_.erase(client);
    for (const Client &other : clients_) watched = watched || other.watching;
  }
  // Not under mutex_: the log calls add_log_line(), which locks it, under its own mutex.
  if (!watched) log_.listen({});
}

void ControlServer::accept_client() {
  const int fd = accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC | SOCK_NONBLOCK);
  if (fd < 0) return;
  if (clients_.size() >= kMaxClients) {
    real::close(fd);
    return;
  }
  const std::lock_guard lock(mutex_);
  clients_.emplace_back().fd = fd;
}

bool ControlServer::receive(Client &client) {
  char bytes[4096];
  const ssize_t size = recv(client.fd, bytes, sizeof bytes, 0);
  if (size < 0) return errno == EAGAIN || errno == EINTR;
  if (size == 0) return client.asked && !client.watching;  // it can still read the answer
  if (client.asked) return true;
  client.request.append(bytes, static_cast<std::size_t>(size));
  const auto end = client.request.find('\n');
  if (end == std::string::npos) return client.request.size() < kMaxRequest;
  client.request.resize(end);
  client.asked = true;
  try {
    answer(client);
  } catch (const std::bad_alloc &) {
    return false;
  }
  return true;
}

void ControlServer::answer(Client &client) {
  const auto [word, rest] = split(client.request, ' ');
  if (word == "log") return watch(client, rest);
  const Answer answer = handler_(client.request);
  const std::lock_guard lock(mutex_);
  client.answer = answer.ok ? "ok\n" + answer.text : "error " + answer.text + "\n";
}

void ControlServer::watch(Client &client, std::string_view options) {
  {
    const std::lock_guard lock(mutex_);
    while (!options.empty()) {
      const auto [option, rest] = split(options, ' ');
      const auto [name, value] = split(option, '=');
      if (name == "only" && device_named(value))
        client.only = value;
      else if (option == "no-reads")
        client.no_reads = true;
      else {
        client.answer = "error \"" + std::string(option) +
                        "\" is unknown; possible are no-reads and only=NODE, with "
                        "a node of encoder, display, audio and video_input\n";
        return;
      }
      options = rest;
    }
    client.answer = "ok\n";
    client.watching = true;
  }
  log_.listen([this](const LogLine &line) { add_log_line(line); });
}

void ControlServer::add_log_line(const LogLine &line) {
  bool added = false;
  {
    const std::lock_guard lock(mutex_);
    for (Client &client : clients_) {
      if (!client.watching || (!client.only.empty() && client.only != line.node)) continue;
      if (client.no_reads && line.of_capture_loop) continue;
      added = true;
      if (client.answer.size() > kMaxBacklog) {
        ++client.lost;
        continue;
      }
      if (client.lost > 0) client.answer += "(" + std::to_string(client.lost) + " lines lost)\n";
      client.lost = 0;
      client.answer += line.text;
    }
  }
  if (added) wake();
}

bool ControlServer::send_answer(Client &client) {
  const std::lock_guard lock(mutex_);
  while (!client.answer.empty()) {
    const ssize_t size = send(client.fd, client.answer.data(), client.answer.size(), MSG_NOSIGNAL);
    if (size < 0) return errno == EAGAIN || errno == EINTR;
    client.answer.erase(0, static_cast<std::size_t>(size));
  }
  return !client.asked || client.watching;
}

}  // namespace virtual_card
