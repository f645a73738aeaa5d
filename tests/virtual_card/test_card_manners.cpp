// The card's manners in a program it does not know: its threads, its own descriptors, its children.

#include <sys/wait.h>

#include <csignal>
#include <filesystem>
#include <fstream>
#include <set>
#include <thread>

#include "node_test.h"

namespace {

std::set<std::filesystem::path> tasks() {
  const std::filesystem::directory_iterator all("/proc/self/task");
  return {begin(all), end(all)};
}

bool blocks(const std::filesystem::path &task, int signal) {
  std::ifstream status(task / "status");
  for (std::string line; std::getline(status, line);)
    if (line.rfind("SigBlk:", 0) == 0) return std::stoull(line.substr(7), nullptr, 16) >> (signal - 1) & 1;
  return false;
}

// A handler on a card thread runs under the card's locks; one that is left over keeps its host from being
// single-threaded again.
TEST_F(NodeTest, ThreadsTakeNoSignalsAndEndAfterTheLastClose) {
  close_nodes();
  card::set_clock(card::ClockMode::real_time);
  std::thread([] {}).join();  // a sanitizer brings up a thread of its own with the first
  const auto before = tasks();
  const auto open_and_run = [this] {
    const auto previews = card::counters().previews;
    open_nodes();
    EXPECT_EQ(send(display, driver::DISP_IOC_PREVIEW_ON), 0);
    EXPECT_TRUE(eventually([&] { return card::counters().previews > previews; }));
  };
  open_and_run();
  EXPECT_GT(tasks().size(), before.size());
  for (const auto &task : tasks())
    for (const int signal : {SIGTERM, SIGINT, SIGALRM, SIGCHLD, SIGUSR1})
      EXPECT_TRUE(before.count(task) != 0 || blocks(task, signal)) << task << " takes signal " << signal;
  close_nodes();
  open_and_run();  // at once
  close_nodes();
  EXPECT_TRUE(eventually([&] { return tasks() == before; }));
  open_and_run();  // when the threads of before have ended
}

// Catches: a card that loses memory or threads to a program that closes all numbers and opens the nodes
// again.
TEST_F(NodeTest, ClosingEveryNumberClosesTheCard) {
  for (u8 way = 0; way < 3; ++way) {
    munmap(region, kRegion);
    if (way == 0) close_range(3, ~0u, 0);
    if (way == 1) closefrom(3);
    for (int fd = 3; fd < 2000; ++fd) close(fd);
    ASSERT_EQ(card::open_descriptors(), 0) << int{way};
    open_nodes();
    EXPECT_EQ(answer(ftruncate(encoder, 0)), -EPERM);
    card::queue_mpeg4({{way, 2, 3}, 64});
    EXPECT_EQ(read_mpeg4(), 64);
    EXPECT_EQ(region[0], way);
  }
}

// No fork handler runs for such a child, which has the parent's memory: a close there is not the parent's.
TEST_F(NodeTest, AVforkChildDoesNotTouchTheParentsCard) {
  const pid_t child = vfork();
  if (child == 0) {
    dup2(display, audio);  // NOLINT(clang-analyzer-unix.Vfork): a child may well do it
    _exit(close(encoder));
  }
  ASSERT_EQ(waitpid(child, nullptr, 0), child);
  EXPECT_EQ(card::open_descriptors(), 4);
  start();
}

// A system without a thread to spare must not end the host.
TEST_F(NodeTest, ThreadsThatCannotBeHadAreAnErrorOrDoneWithout) {
  pthread_attr_t usual, impossible;
  for (pthread_attr_t *each : {&usual, &impossible}) pthread_getattr_default_np(each);
  pthread_attr_setstacksize(&impossible, std::size_t{1} << 46);
  ASSERT_EQ(pthread_setattr_default_np(&impossible), 0);
  for (const u32 channel : {0u, 1u}) encode_channel(channel);
  start();
  card::advance_frames(1);
  EXPECT_EQ(card::counters().mpeg4.made, 2u);
  close_nodes();
  card::set_clock(card::ClockMode::real_time);
  EXPECT_EQ(answer(open(driver::kEncoderNode, O_RDWR)), -EAGAIN);
  ASSERT_EQ(pthread_setattr_default_np(&usual), 0);
}

}  // namespace
