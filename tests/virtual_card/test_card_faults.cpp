// The injector and the log.

#include "node_test.h"

namespace {

using card::Device;
using card::Operation;

TEST_F(NodeTest, AFaultMatchesItsNodeAndCommandOnly) {
  u32 word = 0;
  card::inject({Operation::ioctl, 1, true, EIO, Device::none, driver::DISP_IOC_GET_HEIGHT});
  EXPECT_EQ(send(display, driver::DISP_IOC_GET_WIDTH, word), 0);
  for (int time = 0; time < 3; ++time) EXPECT_EQ(send(display, driver::DISP_IOC_GET_HEIGHT, word), -EIO);
  EXPECT_EQ(card::fault_hits(), 3);
  card::inject({Operation::read, 1, true, EIO, Device::audio});
  EXPECT_EQ(read_mpeg4(), 0);
  EXPECT_EQ(card::fault_hits(), 0);
}

TEST_F(NodeTest, TheLogTellsEveryCallWithItsRecord) {
  card::record_log(true);
  const int fd = open(driver::kVideoInputNode, O_RDWR);
  const u16 thresholds[] = {0x0102, 0x0304};
  const driver::MotionMap map{1, 2, 3, 1, 2, thresholds};
  send(fd, driver::VIN_IOC_SET_MOTION_MAP, map);
  driver::BoardCommand version{driver::kBoardVersion, 0xFF};
  ioctl(fd, driver::VIN_IOC_BOARD_CMD, &version);
  ioctl(encoder, driver::ENC_IOC_STOP, 0);
  ioctl(encoder, 0x1234, 99);
  read_mpeg4();
  void *mapped = mmap(nullptr, driver::kStreamRegionSize, PROT_READ, MAP_SHARED, encoder, 0);
  munmap(mapped, driver::kStreamRegionSize);
  close(fd);
  open("/dev/zarvo_none", O_RDONLY);
  card::record_log(false);
  send(encoder, driver::ENC_IOC_STOP);

  const struct {
    Operation operation;
    Device device;
    u32 code;
    long result;
    std::uintptr_t value;
    std::size_t size;
  } expected[] = {
      {Operation::open, Device::video_input, 0, fd, 0, 0},
      {Operation::ioctl, Device::video_input, driver::VIN_IOC_SET_MOTION_MAP, 0, 0, 0},
      {Operation::ioctl, Device::video_input, driver::VIN_IOC_BOARD_CMD, 0,
       reinterpret_cast<std::uintptr_t>(&version), 0},
      {Operation::ioctl, Device::encoder, driver::ENC_IOC_STOP, 0, 0, 0},
      {Operation::ioctl, Device::encoder, 0x1234, -1, 99, 0},
      {Operation::read, Device::encoder, 0, 0, 0, driver::kMpeg4ReadSize},
      {Operation::mmap, Device::encoder, 0, 0, 0, driver::kStreamRegionSize},
      {Operation::munmap, Device::encoder, 0, 0, 0, driver::kStreamRegionSize},
      {Operation::close, Device::video_input, 0, 0, 0, 0},
      {Operation::open, Device::none, 0, -1, 0, 0},
  };
  auto log = card::log();
  ASSERT_EQ(log.size(), std::size(expected));
  log[1].value = 0;  // the copy that send() made
  for (std::size_t n = 0; n < log.size(); ++n) {
    const auto &want = expected[n];
    EXPECT_EQ(
        std::tie(log[n].operation, log[n].device, log[n].code, log[n].result, log[n].value, log[n].size),
        std::tie(want.operation, want.device, want.code, want.result, want.value, want.size))
        << n;
  }
  EXPECT_EQ(log[0].flags, O_RDWR);
  EXPECT_EQ(std::pair(log[6].protection, log[6].flags), std::pair(PROT_READ, MAP_SHARED));
  ASSERT_EQ(log[1].argument.size(), sizeof map + sizeof thresholds);
  EXPECT_EQ(log[1].argument[4], 2);
  EXPECT_THAT(std::vector<u8>(log[1].argument.end() - 4, log[1].argument.end()),
              testing::ElementsAre(2, 1, 4, 3));
  EXPECT_THAT(log[2].argument, testing::ElementsAre(0x3A, 0, 0, 0, 0xFF, 0, 0, 0)) << "as it came in";
}

// Tests that find the card half reset measure the test before them.
TEST_F(NodeTest, ResetIsRefusedWhileANodeIsOpenAndForgetsEverythingElse) {
  card::record_log(true);
  card::inject({Operation::ioctl, 1, true});
  card::queue_mpeg4({{1}, 1});
  testing::internal::CaptureStderr();
  card::reset();
  card::set_clock(card::ClockMode::real_time);
  EXPECT_THAT(testing::internal::GetCapturedStderr(), testing::HasSubstr("reset() refused"));
  EXPECT_EQ(send(encoder, driver::ENC_IOC_STOP), -EIO);
  EXPECT_EQ(card::fault_hits(), 1);
  close_nodes();
  card::reset();
  EXPECT_EQ(card::fault_hits(), 0);
  EXPECT_EQ(card::counters().mpeg4.made, 0u);
  open_nodes();
  stop();
  EXPECT_EQ(read_mpeg4(), 0);
}

}  // namespace
