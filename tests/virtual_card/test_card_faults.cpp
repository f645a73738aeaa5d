// The injector and the log.

#include "card_fixture.h"

namespace {

using card::Device;
using card::Fault;
using card::Operation;

class Faults : public CardTest {
 protected:
  /// One round over every operation; the errors in the order they came.
  std::vector<long> round() {
    std::vector<long> results;
    const int fd = open(driver::kDisplayNode, O_RDWR);
    results.push_back(fd < 0 ? -errno : 0);
    u32 word = 0;
    results.push_back(send(display, driver::DISP_IOC_GET_WIDTH, word));
    results.push_back(send(display, driver::DISP_IOC_GET_HEIGHT, word));
    results.push_back(read_node(display, &word, driver::kPreviewBufferSize));
    void *mapped = mmap(nullptr, 4096, PROT_READ, MAP_SHARED, display, 0);
    results.push_back(mapped == MAP_FAILED ? -errno : 0);
    if (mapped != MAP_FAILED) {
      results.push_back(answer(munmap(mapped, 4096)));
      if (results.back() < 0) munmap(mapped, 4096);
    }
    if (fd >= 0) results.push_back(answer(close(fd)));
    return results;
  }
  static long failures(const std::vector<long> &results) {
    return std::count_if(results.begin(), results.end(), [](long result) { return result < 0; });
  }
};

// Each operation in turn, until none is left: the fault strikes once, with its number, and leaves the
// card as it was.
TEST_F(Faults, EveryOperationCanFailInTurn) {
  const struct {
    Operation operation;
    int operations_a_round;
  } cases[] = {{Operation::open, 1}, {Operation::ioctl, 2},  {Operation::read, 1},
               {Operation::mmap, 1}, {Operation::munmap, 1}, {Operation::close, 1}};
  for (const auto &each : cases) {
    for (int countdown = 1;; ++countdown) {
      card::inject({each.operation, countdown, false, ENOMEM, Device::display});
      const auto results = round();
      EXPECT_EQ(failures(results), card::fault_hits());
      EXPECT_EQ(card::open_descriptors(), 4);
      EXPECT_EQ(card::open_mappings(), 0);
      if (card::fault_hits() == 0) {
        EXPECT_EQ(countdown, each.operations_a_round + 1);
        break;
      }
      EXPECT_THAT(results, ::testing::Contains(-ENOMEM));
      EXPECT_EQ(failures(round()), 0) << "it struck twice";
    }
  }
}

TEST_F(Faults, AFaultMatchesItsNodeAndCommandOnly) {
  u32 word = 0;
  card::inject({Operation::ioctl, 1, true, EIO, Device::none, driver::DISP_IOC_GET_HEIGHT});
  EXPECT_EQ(send(display, driver::DISP_IOC_GET_WIDTH, word), 0);
  for (int time = 0; time < 3; ++time) EXPECT_EQ(send(display, driver::DISP_IOC_GET_HEIGHT, word), -EIO);
  EXPECT_EQ(card::fault_hits(), 3);
  card::clear_fault();
  EXPECT_EQ(send(display, driver::DISP_IOC_GET_HEIGHT, word), 0);
  card::inject({Operation::read, 1, true, EIO, Device::audio});
  EXPECT_EQ(read_mpeg4(), 0);
  EXPECT_EQ(card::fault_hits(), 0);
}

TEST_F(Faults, TheLogTellsEveryCallWithItsRecord) {
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

  const auto log = card::log();
  ASSERT_EQ(log.size(), 10u);
  const auto expect = [&](std::size_t n, Operation operation, Device device, u32 code, long result) {
    EXPECT_EQ(log[n].operation, operation) << n;
    EXPECT_EQ(log[n].device, device) << n;
    EXPECT_EQ(log[n].code, code) << n;
    EXPECT_EQ(log[n].result, result) << n;
  };
  expect(0, Operation::open, Device::video_input, 0, fd);
  EXPECT_EQ(log[0].flags, O_RDWR);
  expect(1, Operation::ioctl, Device::video_input, driver::VIN_IOC_SET_MOTION_MAP, 0);
  ASSERT_EQ(log[1].argument.size(), sizeof map + sizeof thresholds);
  EXPECT_EQ(log[1].argument[4], 2);
  EXPECT_THAT(std::vector<u8>(log[1].argument.end() - 4, log[1].argument.end()),
              ::testing::ElementsAre(2, 1, 4, 3));
  expect(2, Operation::ioctl, Device::video_input, driver::VIN_IOC_BOARD_CMD, 0);
  EXPECT_THAT(log[2].argument, ::testing::ElementsAre(0x3A, 0, 0, 0, 0xFF, 0, 0, 0)) << "as it came in";
  EXPECT_EQ(log[2].value, reinterpret_cast<std::uintptr_t>(&version));
  expect(3, Operation::ioctl, Device::encoder, driver::ENC_IOC_STOP, 0);
  EXPECT_EQ(log[3].value, 0u);
  expect(4, Operation::ioctl, Device::encoder, 0x1234, -1);
  EXPECT_EQ(log[4].value, 99u);
  expect(5, Operation::read, Device::encoder, 0, 0);
  EXPECT_EQ(log[5].size, driver::kMpeg4ReadSize);
  expect(6, Operation::mmap, Device::encoder, 0, 0);
  EXPECT_EQ(log[6].protection, PROT_READ);
  EXPECT_EQ(log[6].flags, MAP_SHARED);
  EXPECT_EQ(log[6].size, driver::kStreamRegionSize);
  expect(7, Operation::munmap, Device::encoder, 0, 0);
  expect(8, Operation::close, Device::video_input, 0, 0);
  expect(9, Operation::open, Device::none, 0, -1);
}

// Tests that find the card half reset measure the test before them.
TEST_F(Faults, ResetIsRefusedWhileANodeIsOpenAndForgetsEverythingElse) {
  card::record_log(true);
  card::inject({Operation::ioctl, 1, true});
  card::queue_mpeg4({{1}, 1});
  ::testing::internal::CaptureStderr();
  card::reset();
  card::set_clock(card::ClockMode::real_time);
  EXPECT_THAT(::testing::internal::GetCapturedStderr(), ::testing::HasSubstr("reset() refused"));
  EXPECT_EQ(send(encoder, driver::ENC_IOC_STOP), -EIO);
  EXPECT_EQ(card::fault_hits(), 1);
  close_nodes();
  card::reset();
  EXPECT_EQ(card::fault_hits(), 0);
  EXPECT_EQ(card::counters().mpeg4.made, 0u);
  open_nodes();
  EXPECT_EQ(send(encoder, driver::ENC_IOC_STOP), 0);
  EXPECT_EQ(read_mpeg4(), 0);
}

}  // namespace
