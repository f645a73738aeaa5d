// The commands of the four nodes: what they refuse, what they keep, what they answer.

#include "node_test.h"

namespace {

using namespace zarvo::driver;

/// An address where no program has memory.
void *const kNowhere = reinterpret_cast<void *>(64);  // NOLINT(performance-no-int-to-ptr)

TEST_F(NodeTest, EachNodeTakesItsOwnAndRefusesBadOnes) {
  const struct {
    int fd;
    std::vector<u32> none, word, channel;  // by what the argument begins with
  } nodes[] = {{encoder,
                {ENC_IOC_MPEG4_DONE, ENC_IOC_MPEG4_REQUEST, ENC_IOC_STOP, ENC_IOC_START},
                {ENC_IOC_WRITE_REG, ENC_IOC_SET_STANDARD},
                {ENC_IOC_SET_SCALE, ENC_IOC_SET_INTERVAL, ENC_IOC_SET_GOP, ENC_IOC_SET_QP, ENC_IOC_GET_SCALE,
                 ENC_IOC_GET_INTERVAL, ENC_IOC_GET_GOP, ENC_IOC_GET_QP, ENC_IOC_CHANNEL_NUMBER_ON,
                 ENC_IOC_CHANNEL_NUMBER_OFF, ENC_IOC_SET_CBR, ENC_IOC_SET_QP_RANGE}},
               {display,
                {DISP_IOC_BEGIN_UPDATE, DISP_IOC_END_UPDATE, DISP_IOC_MOTION_TRACE_ON,
                 DISP_IOC_MOTION_TRACE_OFF, DISP_IOC_PREVIEW_ON, DISP_IOC_PREVIEW_OFF},
                {DISP_IOC_SET_WINDOW, DISP_IOC_SET_ZOOM, DISP_IOC_SET_SOURCE_CFG, DISP_IOC_SET_GRID,
                 DISP_IOC_SET_RECT, DISP_IOC_GET_WIDTH, DISP_IOC_GET_HEIGHT, DISP_IOC_SET_STANDARD,
                 DISP_IOC_READ_REG, DISP_IOC_WRITE_REG, DISP_IOC_GET_MOTION, DISP_IOC_SELECT_BUFFER},
                {}},
               {video_input,
                {},
                {VIN_IOC_SET_STANDARD, VIN_IOC_READ_REG, VIN_IOC_WRITE_REG, VIN_IOC_READ_TW2815,
                 VIN_IOC_WRITE_TW2815, VIN_IOC_SET_WIDTH, VIN_IOC_BOARD_CMD, VIN_IOC_GET_MOTION_LEVELS},
                {VIN_IOC_SET_MASK, VIN_IOC_SET_MOTION_MAP}}};
  for (const auto &node : nodes) {
    u32 record[16] = {ZV_CHANNELS};
    for (const auto &codes : {node.none, node.word, node.channel})
      for (const u32 code : codes)
        for (const int other : {encoder, display, audio, video_input})
          EXPECT_TRUE(other == node.fd || answer(ioctl(other, code, record)) == -ENOTTY) << code;
    for (const u32 code : node.none) EXPECT_EQ(answer(ioctl(node.fd, code, kNowhere)), 0) << code;
    for (const auto &codes : {node.word, node.channel})
      for (const u32 code : codes)
        for (void *const bad : {static_cast<void *>(nullptr), kNowhere})
          EXPECT_EQ(answer(ioctl(node.fd, code, bad)), -EFAULT) << code;
    for (const u32 code : node.channel) EXPECT_EQ(answer(ioctl(node.fd, code, record)), -EINVAL) << code;
    EXPECT_EQ(answer(ioctl(node.fd, 0x12345678, record)), -ENOTTY);
  }
}

TEST_F(NodeTest, ValuesOutOfRangeChangeNothing) {
  const auto word_record = [](auto... words) { return std::array<u32, sizeof...(words)>{u32(words)...}; };
  EXPECT_EQ(send(encoder, ENC_IOC_SET_SCALE, ChannelValue{2, 9}), 0);
  EXPECT_EQ(send(encoder, ENC_IOC_SET_SCALE, ChannelValue{2, 3}), -EINVAL);
  EXPECT_EQ(send(encoder, ENC_IOC_SET_QP, ChannelValue{2, 32}), -EINVAL);
  ChannelValue scale{2, 0};
  EXPECT_EQ(send(encoder, ENC_IOC_GET_SCALE, scale), 0);
  EXPECT_EQ(scale.value, 9u);

  EXPECT_EQ(send(encoder, ENC_IOC_SET_STANDARD, u32{2}), -EINVAL);
  EXPECT_EQ(send(display, DISP_IOC_SELECT_BUFFER, u32{4}), -EINVAL);
  EXPECT_EQ(send(display, DISP_IOC_SET_SOURCE_CFG, u32{0x40000000}), -EINVAL);
  EXPECT_EQ(send(display, DISP_IOC_SET_RECT, word_record(2, 0, 0, 8, 8, 1, 0)), -EINVAL);
  EXPECT_EQ(send(display, DISP_IOC_SET_WINDOW, word_record(16, 0, 1, 0, 0, 8, 8, 1)), -EINVAL);
  EXPECT_EQ(send(display, DISP_IOC_SET_WINDOW, word_record(0, 16, 1, 0, 0, 8, 8, 1)), -EINVAL);
  EXPECT_EQ(send(display, DISP_IOC_SET_WINDOW, word_record(0, 0, 1, 16, 0, 8, 8, 1)), -EINVAL);
  EXPECT_EQ(send(video_input, VIN_IOC_SET_WIDTH, u32{640}), -EINVAL);
  EXPECT_EQ(send(video_input, VIN_IOC_READ_TW2815, DecoderRegister{4, 0x5A, 0}), -EINVAL);
  EXPECT_EQ(send(video_input, VIN_IOC_WRITE_TW2815, DecoderRegister{4, 0x5A, 0}), -EINVAL);
  EXPECT_EQ(send(video_input, VIN_IOC_SET_MASK, Mask{0, 16, 8, 0, 8}), -EINVAL);
  EXPECT_EQ(send(video_input, VIN_IOC_SET_MASK, Mask{0, 0, 728, 0, 8}), -EINVAL);
  EXPECT_EQ(video_input_register(kRegPrivacyMask), 0u);
}

// An answer that cannot be delivered must be known before the board acts: here the watchdog would run.
TEST_F(NodeTest, ACommandWhoseAnswerCannotBeDeliveredIsNotCarriedOut) {
  static constexpr BoardCommand kReadOnly{kBoardWatchdogOn, VIDEO_STANDARD_ZV_PAL};
  EXPECT_EQ(answer(ioctl(video_input, VIN_IOC_BOARD_CMD, &kReadOnly)), -EFAULT);
  EXPECT_FALSE(card::counters().watchdog_running);
  EXPECT_EQ(answer(ioctl(video_input, VIN_IOC_SET_STANDARD, &kReadOnly.reply)), 0);
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
  EXPECT_EQ(send(video_input, VIN_IOC_WRITE_REG, Register{kRegRouting, 0xA0000001}), 0);
  EXPECT_EQ(card::video_input_register(kRegRouting), 0xA0000001u);

  close_nodes();
  card::reset();
  open_nodes();
  EXPECT_EQ(codec_register(0xFFFFFFFC), 0u);
  EXPECT_EQ(video_input_register(kRegRouting) >> kRoutingShift, 0u);
}

TEST_F(NodeTest, MasksAreKeptInUnitsThatCoverThem) {
  const struct {
    Mask mask;
    u32 packed;
  } cases[] = {{{5, 80, 240, 40, 160}, 0x0A1E0514},
               {{5, 1, 9, 7, 8}, 0x00020001},
               {{5, 0, 720, 0, 576}, 0x005A0048},
               {{5, 0, 0, 0, 0}, 0},
               {{5, 100, 100, 50, 90}, 0x0C0C060B}};
  for (const auto &each : cases) {
    EXPECT_EQ(send(video_input, VIN_IOC_SET_MASK, each.mask), 0);
    EXPECT_EQ(video_input_register(kRegPrivacyMask + 4 * 5), each.packed);
  }
  EXPECT_EQ(video_input_register(kRegPrivacyMask + 4 * 4), 0u);
}

TEST_F(NodeTest, DecodersTellOfCamerasAndInputs) {
  const auto status = [&](u8 chip) {
    DecoderRegister record{chip, kDecoderStatus, 0};
    EXPECT_EQ(send(video_input, VIN_IOC_READ_TW2815, record), 0);
    return record.value;
  };
  card::unplug_camera(0);
  card::unplug_camera(13);
  card::silence_input(2);
  EXPECT_EQ(status(0), 0xBE);
  EXPECT_EQ(status(3), 0x0D);
  card::plug_camera(0);
  card::sound_input(2);
  EXPECT_EQ(status(0), 0xFF);
  card::set_decoder_register(1, kDecoderStatus, 0x0E);
  card::unplug_camera(6);
  EXPECT_EQ(status(1), 0x0E) << "what a test sets holds";

  EXPECT_EQ(card::decoder_register(3, 0x3A), 128);
  EXPECT_EQ(send(video_input, VIN_IOC_WRITE_TW2815, DecoderRegister{3, 0x3A, 200}), 0);
  EXPECT_EQ(card::decoder_register(3, 0x3A), 200);
  EXPECT_EQ(card::decoder_register(2, 0x3A), 128);
}

TEST_F(NodeTest, MotionMapsAndLevels) {
  const std::vector<u16> values(64 * 64, 0x1234);
  const auto level = [&](u32 channel) {
    MotionLevels levels{};
    EXPECT_EQ(send(video_input, VIN_IOC_GET_MOTION_LEVELS, levels), 0);
    return levels.level[channel];
  };
  const auto power_up = level(7);
  const struct {
    u32 column, row, columns, rows;
    const void *thresholds;
    long result;
  } cases[] = {{60, 0, 5, 1, values.data(), -EINVAL},  {0, 64, 1, 1, values.data(), -EINVAL},
               {1, 0, ~0u, 1, values.data(), -EINVAL}, {0, 0, 0, 1, values.data(), -EINVAL},
               {0, 0, 64, 64, nullptr, -EFAULT},       {0, 0, 64, 64, kNowhere, -EFAULT},
               {2, 3, 4, 5, values.data(), 0},         {0, 0, 64, 64, values.data(), 0}};
  for (const auto &[column, row, columns, rows, thresholds, result] : cases) {
    EXPECT_EQ(level(7), power_up) << "before the whole map";
    const MotionMap map{7, column, row, columns, rows, static_cast<const u16 *>(thresholds)};
    EXPECT_EQ(send(video_input, VIN_IOC_SET_MOTION_MAP, map), result);
  }
  EXPECT_EQ(level(7), 0x1234);
  EXPECT_EQ(level(6), power_up);
}

}  // namespace
