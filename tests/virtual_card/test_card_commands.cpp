// The commands of the four nodes: what they refuse, what they keep, what they return.

#include "node_test.h"

namespace {

using namespace zarvo::driver;

/// An address where no program has memory.
void *const kNowhere = reinterpret_cast<void *>(64);  // NOLINT(performance-no-int-to-ptr)

// Catches: a command that is missing or on the wrong node, a record taken from a bad address, a channel above
// the last. Every code that could be a command is tried.
TEST_F(NodeTest, EachNodeTakesItsOwnCommandsAndRefusesBadRecords) {
  const struct {
    int fd;
    u32 letter;
    int commands, refused;  // refused: of those, the ones that refuse a record that begins with 16
  } nodes[] = {{encoder, 'e', 18, 13}, {display, 'd', 18, 4}, {video_input, 'v', 10, 6}, {audio, 'a', 0, 0}};
  for (const auto &node : nodes) {
    int commands = 0, refused = 0;
    for (u32 number = 0; number < 4 * 64 * 256 * 4; ++number) {
      constexpr u32 kLetters[] = {'e', 'd', 'v', 'a'};
      const u32 direction = number >> 16, size = number >> 10 & 0x3F, letter = kLetters[number >> 8 & 3];
      const u32 code = direction << 30 | size << 16 | letter << 8 | (number & 0xFF);
      u32 record[16] = {ZV_CHANNELS};
      const long result = answer(ioctl(node.fd, code, record));
      if (result == -ENOTTY) continue;
      ++commands;
      refused += result == -EINVAL;
      EXPECT_EQ(letter, node.letter);
      const long bad = code >> 16 != 0 ? -EFAULT : 0;  // without a record the argument is not looked at
      EXPECT_EQ(answer(ioctl(node.fd, code, nullptr)), bad) << code;
      EXPECT_EQ(answer(ioctl(node.fd, code, kNowhere)), bad) << code;
    }
    EXPECT_EQ(std::pair(commands, refused), std::pair(node.commands, node.refused)) << char(node.letter);
  }
}

TEST_F(NodeTest, ValuesOutOfRangeChangeNothing) {
  struct {
    int fd;
    u32 code;
    u32 record[8];
  } cases[] = {{encoder, ENC_IOC_SET_SCALE, {2, 3}},
               {encoder, ENC_IOC_SET_QP, {2, 32}},
               {encoder, ENC_IOC_SET_STANDARD, {2}},
               {display, DISP_IOC_SELECT_BUFFER, {4}},
               {display, DISP_IOC_SET_SOURCE_CFG, {0x40000000}},
               {display, DISP_IOC_SET_RECT, {2, 0, 0, 8, 8, 1, 0}},
               {display, DISP_IOC_SET_WINDOW, {16, 0, 1, 0, 0, 8, 8, 1}},
               {display, DISP_IOC_SET_WINDOW, {0, 16, 1, 0, 0, 8, 8, 1}},
               {display, DISP_IOC_SET_WINDOW, {0, 0, 1, 16, 0, 8, 8, 1}},
               {video_input, VIN_IOC_SET_WIDTH, {640}},
               {video_input, VIN_IOC_READ_TW2815, {0x5A04}},  // chip 4
               {video_input, VIN_IOC_WRITE_TW2815, {0x5A04}},
               {video_input, VIN_IOC_SET_MASK, {0, 16, 8, 0, 8}},
               {video_input, VIN_IOC_SET_MASK, {0, 0, 728, 0, 8}}};
  encode(2);
  for (auto &[fd, code, record] : cases) EXPECT_EQ(answer(ioctl(fd, code, record)), -EINVAL) << code;
  EXPECT_EQ(ask(encoder, ENC_IOC_GET_SCALE, 2), 2u);
  EXPECT_EQ(ask(encoder, ENC_IOC_GET_INTERVAL, 2), 1u);
  EXPECT_EQ(ask(encoder, ENC_IOC_GET_QP, 2), 10u);
  EXPECT_EQ(ask(encoder, ENC_IOC_GET_GOP, 2), 30u);
  EXPECT_EQ(video_input_register(kRegPrivacyMask), 0u);
}

// Catches: a board that acts before it is known that its reply can be delivered; here the watchdog would
// run.
TEST_F(NodeTest, ACommandWhoseReplyCannotBeDeliveredIsNotCarriedOut) {
  static constexpr BoardCommand kReadOnly{kBoardWatchdogOn, VIDEO_STANDARD_ZV_PAL};
  EXPECT_EQ(answer(ioctl(video_input, VIN_IOC_BOARD_CMD, &kReadOnly)), -EFAULT);
  EXPECT_FALSE(card::counters().watchdog_running);
  EXPECT_EQ(answer(ioctl(video_input, VIN_IOC_SET_STANDARD, &kReadOnly.reply)), 0);
}

// Catches: a record that is carried out although only its beginning can be read.
TEST_F(NodeTest, ARecordThatEndsInNoMemoryIsRefused) {
  const auto page = static_cast<std::size_t>(sysconf(_SC_PAGESIZE));
  void *const pages = mmap64(nullptr, 2 * page, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
  ASSERT_NE(pages, MAP_FAILED);
  ASSERT_EQ(munmap(static_cast<u8 *>(pages) + page, page), 0);
  u8 *const end = static_cast<u8 *>(pages) + page;
  EXPECT_EQ(answer(ioctl(display, DISP_IOC_WRITE_REG, end - sizeof(Register) / 2)), -EFAULT);
  EXPECT_EQ(answer(ioctl(display, DISP_IOC_WRITE_REG, end - sizeof(Register))), 0);
  munmap(pages, page);
}

TEST_F(NodeTest, RegistersPowerUpAndKeepWhatIsWritten) {
  EXPECT_EQ(codec_register(kRegDisplayState) >> 31, 1u);
  EXPECT_EQ(codec_register(0xFFFFFFFC), 0u);
  EXPECT_EQ(send(display, DISP_IOC_WRITE_REG, Register{0xFFFFFFFC, 5}), 0);
  EXPECT_EQ(codec_register(0xFFFFFFFC), 5u);
  EXPECT_EQ(send(encoder, ENC_IOC_WRITE_REG, Register{kRegMjpegQuality, 6}), 0);
  EXPECT_EQ(codec_register(kRegMjpegQuality), 6u) << "both nodes reach the same chip";
  for (u32 window = 0; window < ZV_CHANNELS; ++window)
    EXPECT_EQ(video_input_register(kRegRouting + 4 * window) >> kRoutingShift, window);
  close_nodes();
  card::reset();
  open_nodes();
  EXPECT_EQ(codec_register(0xFFFFFFFC), 0u);
}

TEST_F(NodeTest, MasksAreKeptInUnitsThatCoverThem) {
  const std::pair<Mask, u32> cases[] = {{{5, 80, 240, 40, 160}, 0x0A1E0514},
                                        {{5, 1, 9, 7, 9}, 0x00020002},
                                        {{5, 0, 720, 0, 576}, 0x005A0048},
                                        {{5, 0, 0, 0, 0}, 0},
                                        {{5, 100, 100, 50, 90}, 0x0C0C060B}};
  for (const auto &[mask, packed] : cases) {
    EXPECT_EQ(send(video_input, VIN_IOC_SET_MASK, mask), 0);
    EXPECT_EQ(video_input_register(kRegPrivacyMask + 4 * 5), packed);
  }
  EXPECT_EQ(video_input_register(kRegPrivacyMask + 4 * 4), 0u);
}

TEST_F(NodeTest, DecodersTellOfCamerasAndInputs) {
  const auto status = [&](u8 chip) {
    return reply(video_input, VIN_IOC_READ_TW2815, DecoderRegister{chip, kDecoderStatus, 0}).value;
  };
  card::apply("lost=1,14;silent=3");
  EXPECT_EQ(status(0), 0xBE);
  EXPECT_EQ(status(3), 0x0D);
  card::apply("lost=14;silent=");
  EXPECT_EQ(status(0), 0xFF);
  card::set_decoder_register(1, kDecoderStatus, 0x0E);
  card::apply("lost=7");
  EXPECT_EQ(status(1), 0x0E) << "what a test sets holds";
}

// Catches: a map that reaches beyond its 64 x 64 blocks, a level that part of a map changes.
TEST_F(NodeTest, MotionMapsAndLevels) {
  const std::vector<u16> values(64 * 64, 0x1234);
  const auto level = [&](u32 channel) {
    return reply(video_input, VIN_IOC_GET_MOTION_LEVELS, MotionLevels{}).level[channel];
  };
  const auto power_up = level(7);
  const std::pair<MotionMap, long> cases[] = {
      {{7, 60, 0, 5, 1, values.data()}, -EINVAL},  {{7, 0, 64, 1, 1, values.data()}, -EINVAL},
      {{7, 1, 0, ~0u, 1, values.data()}, -EINVAL}, {{7, 0, 0, 0, 1, values.data()}, -EINVAL},
      {{7, 0, 0, 64, 64, nullptr}, -EFAULT},       {{7, 0, 0, 64, 63, values.data()}, 0},
      {{7, 0, 0, 63, 64, values.data()}, 0},       {{7, 0, 0, 64, 64, values.data()}, 0}};
  for (const auto &[map, result] : cases) {
    EXPECT_EQ(level(7), power_up) << "before the whole map";
    EXPECT_EQ(send(video_input, VIN_IOC_SET_MOTION_MAP, map), result);
  }
  EXPECT_EQ(level(7), 0x1234);
  EXPECT_EQ(level(6), power_up);
}

}  // namespace
