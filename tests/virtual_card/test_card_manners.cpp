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

/// The mask of the signals that a thread has blocked.
unsigned long long blocked(const std::filesystem::path &task) {
  std::ifstream status(task / "status");
  const std::string text{std::istreambuf_iterator<char>(status), {}};
  return std::stoull(text.substr(text.find("SigBlk:") + 7), nullptr, 16);
}

// Catches: a host's signal handler that runs on a card thread, under the card's locks; a thread that is
// left over.
TEST_F(NodeTest, ThreadsTakeNoSignalsAndEndAfterTheLastClose) {
  close_nodes();
  card::set_clock(card::ClockMode::real_time);
  std::thread([] {}).join();  // a sanitizer starts a thread of its own with the first
  const auto before = tasks();
  for (int time = 0; time < 2; ++time) {
    const auto previews = card::counters().previews;
    open_nodes();
    EXPECT_EQ(send(display, driver::DISP_IOC_PREVIEW_ON), 0);
    EXPECT_TRUE(eventually([&] { return card::counters().previews > previews; }));
    EXPECT_GT(tasks().size(), before.size());
    for (const auto &task : tasks())
      for (const int signal : {SIGTERM, SIGINT, SIGALRM, SIGCHLD, SIGUSR1})
        EXPECT_TRUE(before.count(task) != 0 || blocked(task) >> (signal - 1) & 1) << "takes " << signal;
    close_nodes();
    EXPECT_TRUE(eventually([&] { return tasks() == before; }));
  }
}

// For ThreadSanitizer. Catches: a lock that is missing where a running card and its host meet.
TEST_F(NodeTest, ARunningCardTakesCommands) {
  run_with(card::ClockMode::fast, 4);
  const std::vector<u16> thresholds(64 * 64, 9);
  for (u32 round = 0; round < 10; ++round) {
    const u32 channel = round % 2;
    encode(channel);
    start();
    send(display, driver::DISP_IOC_PREVIEW_ON);
    send(display, driver::DISP_IOC_SET_WINDOW, ZV_DISPLAY_WINDOW{0, 0, 1, 0, 0, 360, 240, 1});
    send(display, driver::DISP_IOC_WRITE_REG, driver::Register{driver::kRegMotionEnable, ~0u});
    send(video_input, driver::VIN_IOC_SET_STANDARD, channel);
    send(video_input, driver::VIN_IOC_SET_MOTION_MAP,
         driver::MotionMap{channel, 0, 0, 64, 64, thresholds.data()});
    card::apply(round % 3 == 0 ? "still=1-2" : "still=;drop=mpeg4:2");
    const auto previews = card::counters().previews;
    EXPECT_TRUE(eventually([&] { return card::counters().previews > previews; }));
    reply(display, driver::DISP_IOC_GET_MOTION, u32{});
    read_mpeg4();
    if (round % 4 == 1) stop();
    if (round % 4 == 3) run_with(card::ClockMode::fast, 4);
  }
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

// Catches: a close in a child without fork handlers and with the parent's memory that closes the parent's
// card.
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

// Catches: a system that is out of threads and ends the host.
TEST_F(NodeTest, ThreadsThatCannotBeHadAreAnErrorOrDoneWithout) {
  pthread_attr_t usual, impossible;
  for (pthread_attr_t *each : {&usual, &impossible}) pthread_getattr_default_np(each);
  pthread_attr_setstacksize(&impossible, std::size_t{1} << 46);
  ASSERT_EQ(pthread_setattr_default_np(&impossible), 0);
  for (const u32 channel : {0u, 1u}) encode(channel);
  start();
  card::advance_frames(1);
  EXPECT_EQ(card::counters().mpeg4.made, 2u);
  close_nodes();
  card::set_clock(card::ClockMode::real_time);
  EXPECT_EQ(answer(open(driver::kEncoderNode, O_RDWR)), -EAGAIN);
  ASSERT_EQ(pthread_setattr_default_np(&usual), 0);
}

}  // namespace
