// The control socket, as zarvo_card uses it.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <random>

#include "nodes/control_server.h"
#include "support.h"

namespace {

using card::CallLog, card::ControlServer;

class ControlTest : public testing::Test {
 protected:
  ControlTest() {
    EXPECT_NE(mkdtemp(folder_), nullptr);
    path = std::string(folder_) + "/card";
  }
  ~ControlTest() override { std::filesystem::remove_all(folder_); }

  static sockaddr_un address_of(const std::string &path) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    path.copy(address.sun_path, sizeof address.sun_path - 1);
    return address;
  }
  int connected() const {
    const sockaddr_un address = address_of(path);
    const int fd = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    EXPECT_EQ(connect(fd, reinterpret_cast<const sockaddr *>(&address), sizeof address), 0);
    return fd;
  }
  static std::string receive(int fd) {
    char bytes[4096];
    const ssize_t size = recv(fd, bytes, sizeof bytes, 0);
    return {bytes, static_cast<std::size_t>(std::max<ssize_t>(size, 0))};
  }
  std::string ask(const std::string &request) const {
    const int fd = connected();
    send(fd, request.data(), request.size(), MSG_NOSIGNAL);
    std::string answer;
    for (std::string piece; !(piece = receive(fd)).empty();) answer += piece;
    close(fd);
    return answer;
  }
  void add_call(card::Operation operation, card::Device device) {
    log.add({operation, device}, 0, std::chrono::seconds{1});
  }

  std::string path;
  CallLog log;
  ControlServer server{log, [](std::string_view request) {
                         return ControlServer::Answer{request != "bad", "<" + std::string(request) + ">"};
                       }};

 private:
  char folder_[32] = "/tmp/zarvo-control-XXXXXX";
};

TEST_F(ControlTest, ListensForTheOwnerAloneAndLeavesNothingBehind) {
  ASSERT_EQ(server.start(path), "");
  struct stat status {};
  ASSERT_EQ(stat(path.c_str(), &status), 0);
  EXPECT_EQ(status.st_mode, mode_t{S_IFSOCK | 0600});
  EXPECT_EQ(ask("hello\n"), "ok\n<hello>");
  EXPECT_EQ(ask("bad\n"), "error <bad>\n");
  CallLog other_log;
  ControlServer second(other_log, {});
  EXPECT_THAT(second.start(path), testing::HasSubstr("another program listens"));
  server.stop();
  EXPECT_FALSE(std::filesystem::exists(path));
}

TEST_F(ControlTest, ReplacesAStaleSocketButNoOtherFile) {
  const sockaddr_un address = address_of(path);
  const int stale = socket(AF_UNIX, SOCK_STREAM, 0);
  ASSERT_EQ(bind(stale, reinterpret_cast<const sockaddr *>(&address), sizeof address), 0);
  close(stale);
  EXPECT_EQ(server.start(path), "");
  server.stop();
  std::ofstream(path) << "precious";
  EXPECT_THAT(server.start(path), testing::HasSubstr("no socket"));
  EXPECT_EQ(std::filesystem::file_size(path), 8u);
  EXPECT_THAT(server.start(std::string(200, 'x')), testing::HasSubstr("too long"));
}

TEST_F(ControlTest, ALogClientGetsItsLinesAndIsToldWhatItMissed) {
  ASSERT_EQ(server.start(path), "");
  const int slow = connected();
  send(slow, "log only=display no-reads\n", 26, 0);
  EXPECT_EQ(receive(slow), "ok\n");
  add_call(card::Operation::open, card::Device::encoder);
  add_call(card::Operation::read, card::Device::display);
  add_call(card::Operation::open, card::Device::display);
  EXPECT_EQ(receive(slow), "1.000000 display open = 0\n");
  for (int n = 0; n < 100'000; ++n) add_call(card::Operation::mmap, card::Device::display);
  std::string lines;
  while (lines.find("lines lost") == std::string::npos) {
    lines = lines.substr(lines.size() < 100 ? 0 : lines.size() - 100) + receive(slow);
    add_call(card::Operation::munmap, card::Device::display);
  }
  close(slow);
  while (log.on()) add_call(card::Operation::munmap, card::Device::display);  // ends when the client has gone
}

TEST_F(ControlTest, ALogClientKeepsItsLinesWhenOthersLeave) {
  ASSERT_EQ(server.start(path), "");
  const int watcher = connected(), other = connected();
  for (const int client : {watcher, other}) {
    send(client, "log\n", 4, 0);
    EXPECT_EQ(receive(client), "ok\n");
  }
  close(other);
  for (int n = 0; n < 3; ++n) EXPECT_EQ(ask("after it\n"), "ok\n<after it>");  // it has left by now
  add_call(card::Operation::open, card::Device::encoder);
  pollfd readable{watcher, POLLIN, 0};
  ASSERT_EQ(poll(&readable, 1, 10'000), 1);
  EXPECT_EQ(receive(watcher), "1.000000 encoder open = 0\n");
  close(watcher);
}

TEST_F(ControlTest, RandomRequestsHarmNobody) {
  ASSERT_EQ(server.start(path), "");
  std::mt19937 random(11);
  for (int n = 0; n < 1000; ++n) {
    std::string request(random() % 40, ' ');
    for (char &letter : request) letter = static_cast<char>(random());
    if (n % 3 == 0) {  // gone without a word, or in the middle of one
      const int fd = connected();
      send(fd, request.data(), request.size(), MSG_NOSIGNAL);
      close(fd);
    } else {
      const std::string answer = ask("x" + request + "\n");
      EXPECT_TRUE(answer.starts_with("ok\n<x")) << answer;
    }
  }
  const int endless = connected();
  const std::string megabyte(1 << 20, 'x');
  send(endless, megabyte.data(), megabyte.size(), MSG_NOSIGNAL);
  EXPECT_EQ(receive(endless), "") << "a request without an end is cut off";
  close(endless);
  EXPECT_EQ(ask("still here\n"), "ok\n<still here>");
}

}  // namespace
