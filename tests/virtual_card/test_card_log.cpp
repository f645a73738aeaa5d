// The log, and the reset of the card.

#include "node_test.h"

namespace {

using card::Device, card::Operation;

TEST_F(NodeTest, TheLogTellsEveryCallWithItsRecord) {
  card::record_log(true);
  const int fd = open(driver::kVideoInputNode, O_RDWR);
  const u16 thresholds[] = {0x0102, 0x0304};
  send(fd, driver::VIN_IOC_SET_MOTION_MAP, driver::MotionMap{1, 2, 3, 1, 2, thresholds});
  board_command(driver::kBoardVersion);
  ioctl(encoder, 0x1234, 99);
  read_mpeg4();
  munmap(mmap(nullptr, kRegion, PROT_READ, MAP_SHARED, encoder, 0), kRegion);
  close(fd);
  open("/dev/zarvo_none", O_RDONLY);
  card::record_log(false);
  stop();

  const auto log = card::log();
  std::vector<std::pair<Operation, Device>> calls;
  calls.reserve(log.size());
  for (const card::Call &call : log) calls.emplace_back(call.operation, call.device);
  ASSERT_THAT(
      calls,
      testing::ElementsAre(
          std::pair(Operation::open, Device::video_input), std::pair(Operation::ioctl, Device::video_input),
          std::pair(Operation::ioctl, Device::video_input), std::pair(Operation::ioctl, Device::encoder),
          std::pair(Operation::read, Device::encoder), std::pair(Operation::mmap, Device::encoder),
          std::pair(Operation::munmap, Device::encoder), std::pair(Operation::close, Device::video_input),
          std::pair(Operation::open, Device::none)));
  EXPECT_EQ(log[0].result, fd);
  EXPECT_EQ(std::pair(log[3].error, log[8].error), std::pair(ENOTTY, ENOENT));
  EXPECT_EQ(log[0].flags, O_RDWR);
  EXPECT_EQ(log[1].code, driver::VIN_IOC_SET_MOTION_MAP);
  ASSERT_EQ(log[1].argument.size(), sizeof(driver::MotionMap) + sizeof thresholds);
  EXPECT_EQ(log[1].argument[4], 2);
  EXPECT_THAT(std::vector<u8>(log[1].argument.end() - 4, log[1].argument.end()),
              testing::ElementsAre(2, 1, 4, 3));
  EXPECT_THAT(log[2].argument, testing::ElementsAre(0x3A, 0, 0, 0, 0xFF, 0, 0, 0)) << "as it came in";
  EXPECT_TRUE(log[3].value == 99 && log[3].result == -1);
  EXPECT_EQ(log[4].size, driver::kMpeg4ReadSize);
  EXPECT_TRUE(log[5].size == kRegion && log[5].protection == PROT_READ && log[5].flags == MAP_SHARED);
  card::record_log(true);
  EXPECT_TRUE(card::log().empty());
}

// Tests that find the card half reset measure the test before them.
TEST_F(NodeTest, ResetIsRefusedWhileANodeIsOpenAndForgetsEverythingElse) {
  card::apply("fail=any/ioctl:EIO");
  card::queue_mpeg4({{1}, 1});
  testing::internal::CaptureStderr();
  card::reset();
  card::set_clock(card::ClockMode::real_time);
  EXPECT_THAT(testing::internal::GetCapturedStderr(), testing::HasSubstr("reset() refused"));
  EXPECT_EQ(send(encoder, driver::ENC_IOC_STOP), -EIO);
  EXPECT_EQ(card::counters().failed_calls, 1u);
  close_nodes();
  card::reset();
  EXPECT_EQ(card::counters().failed_calls, 0u);
  EXPECT_EQ(card::counters().mpeg4.made, 0u);
  open_nodes();
  stop();
  EXPECT_EQ(read_mpeg4(), 0);
}

}  // namespace
