#ifndef TESTS_VIRTUAL_CARD_CARD_FIXTURE_H
#define TESTS_VIRTUAL_CARD_CARD_FIXTURE_H

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/ioctl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cerrno>
#include <span>

#include "support.h"
#include "virtual_card.h"
#include "zv_driver.h"

namespace card = virtual_card;
namespace driver = zarvo::driver;
using namespace std::chrono_literals;

/// A call's result, or the negated error number.
inline long answer(long result) {
  return result == -1 ? -errno : result;
}

/// A read that the compiler does not check: the card's reads take null, and counts beyond the buffer.
inline long read_node(int fd, void *buffer, std::size_t count) {
  void *volatile unchecked = buffer;
  return answer(read(fd, unchecked, count));
}

/// Sends a record to a node and takes back what it answered.
template <typename Record>
long send(int fd, u32 code, Record &record) {
  return answer(ioctl(fd, code, &record));
}
template <typename Record>
long send(int fd, u32 code, const Record &record) {
  Record copy = record;
  return send(fd, code, copy);
}
inline long send(int fd, u32 code) {
  return answer(ioctl(fd, code));
}

/// A card as built whose time only the test moves, with its four nodes open.
class CardTest : public ::testing::Test {
 protected:
  void SetUp() override {
    card::reset();
    card::set_clock(card::ClockMode::manual);
    open_nodes();
  }
  void TearDown() override {
    close_nodes();
    EXPECT_EQ(card::open_descriptors(), 0);
    EXPECT_EQ(card::open_mappings(), 0);
  }

  void open_nodes() {
    encoder = open(driver::kEncoderNode, O_RDWR | O_CLOEXEC);
    display = open(driver::kDisplayNode, O_RDWR | O_CLOEXEC);
    audio = open(driver::kAudioNode, O_RDWR | O_CLOEXEC);
    video_input = open(driver::kVideoInputNode, O_RDWR | O_CLOEXEC);
    ASSERT_TRUE(encoder >= 0 && display >= 0 && audio >= 0 && video_input >= 0);
  }
  void close_nodes() {
    for (int *fd : {&encoder, &display, &audio, &video_input})
      if (*fd >= 0) close(std::exchange(*fd, -1));
  }

  long read_mpeg4() { return read_node(encoder, nullptr, driver::kMpeg4ReadSize); }
  long read_mjpeg() { return read_node(encoder, nullptr, driver::kMjpegReadSize); }
  /// What the node answers in the second word of a record.
  static u32 ask(int fd, u32 code, u32 first) {
    std::array<u32, 2> record{first, 0xFF};
    EXPECT_EQ(send(fd, code, record), 0);
    return record[1];
  }
  u32 codec_register(u32 address) { return ask(display, driver::DISP_IOC_READ_REG, address); }
  u32 video_input_register(u32 address) { return ask(video_input, driver::VIN_IOC_READ_REG, address); }
  u32 board_command(u32 command) { return ask(video_input, driver::VIN_IOC_BOARD_CMD, command); }
  /// One channel in CIF at 30 frames a second.
  void encode_channel(u32 channel) {
    EXPECT_EQ(send(encoder, driver::ENC_IOC_SET_SCALE, driver::ChannelValue{channel, 2}), 0);
    EXPECT_EQ(send(encoder, driver::ENC_IOC_SET_INTERVAL, driver::Interval{channel, 1, 0}), 0);
    EXPECT_EQ(send(encoder, driver::ENC_IOC_SET_QP, driver::ChannelValue{channel, 10}), 0);
    EXPECT_EQ(send(encoder, driver::ENC_IOC_SET_GOP, driver::ChannelValue{channel, 30}), 0);
  }

  int encoder = -1;
  int display = -1;
  int audio = -1;
  int video_input = -1;
};

#endif
