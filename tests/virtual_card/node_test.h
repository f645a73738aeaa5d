/**
 * @file node_test.h
 * The world of the tests that reach the card as a program does: libc calls on its device nodes.
 */
#ifndef NODE_TEST_H
#define NODE_TEST_H

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/ioctl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cerrno>
#include <utility>

#include "support.h"
#include "virtual_card.h"
#include "zv_driver.h"

namespace driver = zarvo::driver;
using namespace std::chrono_literals;

/// The result of a call, or the negated error number.
inline long answer(long result) {
  return result == -1 ? -errno : result;
}
/// A read that the compiler does not check: the card's reads take null, and counts beyond the buffer.
inline long read_node(int fd, void *buffer, std::size_t count) {
  void *volatile unchecked = buffer;
  return answer(read(fd, unchecked, count));
}
/// The result of a command, with its record if it takes one.
long send(int fd, u32 code, auto... record) {
  return answer(ioctl(fd, code, &record...));
}
/// The record that a command returns.
auto reply(int fd, u32 code, auto record) {
  EXPECT_EQ(answer(ioctl(fd, code, &record)), 0);
  return record;
}

/// A card at power-up whose time stands still until the test advances it, with its four nodes open.
class NodeTest : public testing::Test {
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
    encoder = open(driver::kEncoderNode, O_RDWR);
    display = open(driver::kDisplayNode, O_RDWR);
    audio = open(driver::kAudioNode, O_RDWR);
    video_input = open(driver::kVideoInputNode, O_RDWR);
    ASSERT_TRUE(encoder >= 0 && display >= 0 && audio >= 0 && video_input >= 0);
    region = static_cast<u8 *>(mmap(nullptr, kRegion, PROT_READ | PROT_WRITE, MAP_SHARED, encoder, 0));
    ASSERT_NE(region, MAP_FAILED);
  }
  void close_nodes() {
    if (region != nullptr) munmap(std::exchange(region, nullptr), kRegion);
    for (int *fd : {&encoder, &display, &audio, &video_input})
      if (*fd >= 0) close(std::exchange(*fd, -1));
  }
  /// Opens the nodes again, with another clock.
  void run_with(card::ClockMode mode, double speed = 1) {
    close_nodes();
    card::set_clock(mode, speed);
    open_nodes();
  }

  /// Encodes a channel in CIF, 30 frames a second, with quantiser 10.
  void encode(u32 channel, u32 gop = 30) {
    EXPECT_EQ(send(encoder, driver::ENC_IOC_SET_SCALE, driver::ChannelValue{channel, 2}), 0);
    EXPECT_EQ(send(encoder, driver::ENC_IOC_SET_INTERVAL, driver::Interval{channel, 1, 0}), 0);
    EXPECT_EQ(send(encoder, driver::ENC_IOC_SET_QP, driver::ChannelValue{channel, 10}), 0);
    EXPECT_EQ(send(encoder, driver::ENC_IOC_SET_GOP, driver::ChannelValue{channel, gop}), 0);
  }
  void start() { EXPECT_EQ(send(encoder, driver::ENC_IOC_START), 0); }
  void stop() { EXPECT_EQ(send(encoder, driver::ENC_IOC_STOP), 0); }
  long read_mpeg4() { return read_node(encoder, nullptr, driver::kMpeg4ReadSize); }
  long read_mjpeg() { return read_node(encoder, nullptr, driver::kMjpegReadSize); }
  long read_audio() { return read_node(audio, audio_blocks.data(), driver::kAudioReadCount); }
  /// The second word of a record, after a command that takes the first.
  static u32 ask(int fd, u32 code, u32 first) { return reply(fd, code, std::array<u32, 4>{first, 0xFF})[1]; }
  u32 codec_register(u32 address) { return ask(display, driver::DISP_IOC_READ_REG, address); }
  u32 video_input_register(u32 address) { return ask(video_input, driver::VIN_IOC_READ_REG, address); }
  u32 board_command(u32 command) { return ask(video_input, driver::VIN_IOC_BOARD_CMD, command); }

  static constexpr std::size_t kRegion = driver::kStreamRegionSize;
  int encoder = -1, display = -1, audio = -1, video_input = -1;
  u8 *region = nullptr;  ///< the stream region
  std::array<u8, 256> audio_blocks{};
};

#endif
