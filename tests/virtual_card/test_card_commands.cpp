// The commands of the four nodes: what they refuse, what they keep, what they answer.

#include <cstring>

#include "card_fixture.h"

namespace {

enum class Record { none, word, channel };  // what a command's argument begins with

struct KnownCommand {
  u32 code;
  Record record;
};

const KnownCommand kEncoderCommands[] = {
    {driver::ENC_IOC_SET_SCALE, Record::channel},
    {driver::ENC_IOC_SET_INTERVAL, Record::channel},
    {driver::ENC_IOC_SET_GOP, Record::channel},
    {driver::ENC_IOC_SET_QP, Record::channel},
    {driver::ENC_IOC_GET_SCALE, Record::channel},
    {driver::ENC_IOC_GET_INTERVAL, Record::channel},
    {driver::ENC_IOC_GET_GOP, Record::channel},
    {driver::ENC_IOC_GET_QP, Record::channel},
    {driver::ENC_IOC_MPEG4_DONE, Record::none},
    {driver::ENC_IOC_CHANNEL_NUMBER_ON, Record::channel},
    {driver::ENC_IOC_CHANNEL_NUMBER_OFF, Record::channel},
    {driver::ENC_IOC_WRITE_REG, Record::word},
    {driver::ENC_IOC_MPEG4_REQUEST, Record::none},
    {driver::ENC_IOC_STOP, Record::none},
    {driver::ENC_IOC_SET_STANDARD, Record::word},
    {driver::ENC_IOC_START, Record::none},
    {driver::ENC_IOC_SET_CBR, Record::channel},
    {driver::ENC_IOC_SET_QP_RANGE, Record::channel},
};
const KnownCommand kDisplayCommands[] = {
    {driver::DISP_IOC_BEGIN_UPDATE, Record::none},     {driver::DISP_IOC_END_UPDATE, Record::none},
    {driver::DISP_IOC_SET_WINDOW, Record::word},       {driver::DISP_IOC_SET_ZOOM, Record::word},
    {driver::DISP_IOC_SET_SOURCE_CFG, Record::word},   {driver::DISP_IOC_SET_GRID, Record::word},
    {driver::DISP_IOC_SET_RECT, Record::word},         {driver::DISP_IOC_MOTION_TRACE_ON, Record::none},
    {driver::DISP_IOC_MOTION_TRACE_OFF, Record::none}, {driver::DISP_IOC_GET_WIDTH, Record::word},
    {driver::DISP_IOC_GET_HEIGHT, Record::word},       {driver::DISP_IOC_SET_STANDARD, Record::word},
    {driver::DISP_IOC_READ_REG, Record::word},         {driver::DISP_IOC_WRITE_REG, Record::word},
    {driver::DISP_IOC_PREVIEW_ON, Record::none},       {driver::DISP_IOC_PREVIEW_OFF, Record::none},
    {driver::DISP_IOC_GET_MOTION, Record::word},       {driver::DISP_IOC_SELECT_BUFFER, Record::word},
};
const KnownCommand kVideoInputCommands[] = {
    {driver::VIN_IOC_SET_MASK, Record::channel},  {driver::VIN_IOC_SET_MOTION_MAP, Record::channel},
    {driver::VIN_IOC_SET_STANDARD, Record::word}, {driver::VIN_IOC_READ_REG, Record::word},
    {driver::VIN_IOC_WRITE_REG, Record::word},    {driver::VIN_IOC_READ_TW2815, Record::word},
    {driver::VIN_IOC_WRITE_TW2815, Record::word}, {driver::VIN_IOC_SET_WIDTH, Record::word},
    {driver::VIN_IOC_BOARD_CMD, Record::word},    {driver::VIN_IOC_GET_MOTION_LEVELS, Record::word},
};

class Commands : public CardTest {
 protected:
  void SetUp() override {
    CardTest::SetUp();
    no_access = static_cast<u8 *>(mmap(nullptr, 4096, PROT_NONE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0));
    read_only = static_cast<u8 *>(mmap(nullptr, 4096, PROT_READ, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0));
  }
  void TearDown() override {
    munmap(no_access, 4096);
    munmap(read_only, 4096);
    CardTest::TearDown();
  }

  u8 *no_access = nullptr;
  u8 *read_only = nullptr;
};

TEST_F(Commands, EachNodeTakesItsOwnAndRefusesBadOnes) {
  const struct {
    int fd;
    std::span<const KnownCommand> commands;
  } nodes[] = {{encoder, kEncoderCommands}, {display, kDisplayCommands}, {video_input, kVideoInputCommands}};
  u8 record[64];
  for (const auto &node : nodes) {
    for (const KnownCommand &command : node.commands) {
      SCOPED_TRACE(command.code);
      std::memset(record, 0, sizeof record);
      for (const int other : {encoder, display, audio, video_input}) {
        if (other == node.fd) continue;
        EXPECT_EQ(answer(ioctl(other, command.code, record)), -ENOTTY);
      }
      if (command.record == Record::none) {
        EXPECT_EQ(answer(ioctl(node.fd, command.code, no_access)), 0);
        continue;
      }
      EXPECT_EQ(answer(ioctl(node.fd, command.code, nullptr)), -EFAULT);
      EXPECT_EQ(answer(ioctl(node.fd, command.code, no_access)), -EFAULT);
      if (command.record == Record::channel) {
        const u32 channel = ZV_CHANNELS;
        std::memcpy(record, &channel, sizeof channel);
        EXPECT_EQ(answer(ioctl(node.fd, command.code, record)), -EINVAL);
      }
    }
    EXPECT_EQ(answer(ioctl(node.fd, 0x12345678, record)), -ENOTTY);
  }
}

TEST_F(Commands, ValuesOutOfRangeChangeNothing) {
  const auto word_record = [](auto... words) { return std::array<u32, sizeof...(words)>{u32(words)...}; };
  EXPECT_EQ(send(encoder, driver::ENC_IOC_SET_SCALE, driver::ChannelValue{2, 9}), 0);
  EXPECT_EQ(send(encoder, driver::ENC_IOC_SET_SCALE, driver::ChannelValue{2, 3}), -EINVAL);
  EXPECT_EQ(send(encoder, driver::ENC_IOC_SET_QP, driver::ChannelValue{2, 32}), -EINVAL);
  driver::ChannelValue scale{2, 0};
  EXPECT_EQ(send(encoder, driver::ENC_IOC_GET_SCALE, scale), 0);
  EXPECT_EQ(scale.value, 9u);

  EXPECT_EQ(send(encoder, driver::ENC_IOC_SET_STANDARD, u32{2}), -EINVAL);
  EXPECT_EQ(send(display, driver::DISP_IOC_SELECT_BUFFER, u32{4}), -EINVAL);
  EXPECT_EQ(send(display, driver::DISP_IOC_SET_SOURCE_CFG, u32{0x40000000}), -EINVAL);
  EXPECT_EQ(send(display, driver::DISP_IOC_SET_RECT, word_record(2, 0, 0, 8, 8, 1, 0)), -EINVAL);
  EXPECT_EQ(send(display, driver::DISP_IOC_SET_WINDOW, word_record(16, 0, 1, 0, 0, 8, 8, 1)), -EINVAL);
  EXPECT_EQ(send(display, driver::DISP_IOC_SET_WINDOW, word_record(0, 16, 1, 0, 0, 8, 8, 1)), -EINVAL);
  EXPECT_EQ(send(display, driver::DISP_IOC_SET_WINDOW, word_record(0, 0, 1, 16, 0, 8, 8, 1)), -EINVAL);
  EXPECT_EQ(send(video_input, driver::VIN_IOC_SET_WIDTH, u32{640}), -EINVAL);
  EXPECT_EQ(send(video_input, driver::VIN_IOC_READ_TW2815, driver::DecoderRegister{4, 0x5A, 0}), -EINVAL);
  EXPECT_EQ(send(video_input, driver::VIN_IOC_WRITE_TW2815, driver::DecoderRegister{4, 0x5A, 0}), -EINVAL);
  EXPECT_EQ(send(video_input, driver::VIN_IOC_SET_MASK, driver::Mask{0, 16, 8, 0, 8}), -EINVAL);
  EXPECT_EQ(send(video_input, driver::VIN_IOC_SET_MASK, driver::Mask{0, 0, 728, 0, 8}), -EINVAL);
  EXPECT_EQ(video_input_register(driver::kRegPrivacyMask), 0u);
}

// An answer that cannot be delivered must be known before the board acts: here the watchdog would run.
TEST_F(Commands, ACommandWhoseAnswerCannotBeDeliveredIsNotCarriedOut) {
  ASSERT_EQ(mprotect(read_only, 4096, PROT_READ | PROT_WRITE), 0);
  std::memcpy(read_only, &driver::kBoardWatchdogOn, sizeof(u32));
  ASSERT_EQ(mprotect(read_only, 4096, PROT_READ), 0);
  EXPECT_EQ(answer(ioctl(video_input, driver::VIN_IOC_BOARD_CMD, read_only)), -EFAULT);
  EXPECT_FALSE(card::counters().watchdog_running);
  EXPECT_EQ(answer(ioctl(video_input, driver::VIN_IOC_SET_STANDARD, read_only + 64)), 0);
}

TEST_F(Commands, EncoderSettingsReadBackPerChannel) {
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) {
    EXPECT_EQ(send(encoder, driver::ENC_IOC_SET_GOP, driver::ChannelValue{channel, 100 + channel}), 0);
    EXPECT_EQ(send(encoder, driver::ENC_IOC_SET_QP, driver::ChannelValue{channel, 1 + channel}), 0);
    EXPECT_EQ(send(encoder, driver::ENC_IOC_SET_INTERVAL, driver::Interval{channel, 0x200 | channel, 1}), 0);
  }
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) {
    driver::ChannelValue gop{channel, 0};
    driver::ChannelValue qp{channel, 0};
    driver::Interval interval{channel, 0, 7};
    EXPECT_EQ(send(encoder, driver::ENC_IOC_GET_GOP, gop), 0);
    EXPECT_EQ(send(encoder, driver::ENC_IOC_GET_QP, qp), 0);
    EXPECT_EQ(send(encoder, driver::ENC_IOC_GET_INTERVAL, interval), 0);
    EXPECT_EQ(gop.value, 100 + channel);
    EXPECT_EQ(qp.value, 1 + channel);
    EXPECT_EQ(interval.code, 0x200 | channel);
  }
}

TEST_F(Commands, RegistersPowerUpAndKeepWhatIsWritten) {
  EXPECT_EQ(codec_register(driver::kRegDisplayState) >> 31, 1u);
  EXPECT_EQ(codec_register(0xFFFFFFFC), 0u);
  EXPECT_EQ(send(display, driver::DISP_IOC_WRITE_REG, driver::Register{0xFFFFFFFC, 5}), 0);
  EXPECT_EQ(codec_register(0xFFFFFFFC), 5u);
  EXPECT_EQ(send(encoder, driver::ENC_IOC_WRITE_REG, driver::Register{driver::kRegMjpegQuality, 6}), 0);
  EXPECT_EQ(codec_register(driver::kRegMjpegQuality), 6u) << "both nodes reach the same chip";
  EXPECT_EQ(card::codec_register(driver::kRegMjpegQuality), 6u);
  card::set_codec_register(driver::kRegMotionEnable, 0x00010002);
  EXPECT_EQ(codec_register(driver::kRegMotionEnable), 0x00010002u);

  for (u32 window = 0; window < ZV_CHANNELS; ++window)
    EXPECT_EQ(video_input_register(driver::kRegRouting + 4 * window) >> driver::kRoutingShift, window);
  EXPECT_EQ(send(video_input, driver::VIN_IOC_WRITE_REG, driver::Register{driver::kRegRouting, 0xA0000001}),
            0);
  EXPECT_EQ(card::video_input_register(driver::kRegRouting), 0xA0000001u);

  close_nodes();
  card::reset();
  open_nodes();
  EXPECT_EQ(codec_register(0xFFFFFFFC), 0u);
  EXPECT_EQ(video_input_register(driver::kRegRouting) >> driver::kRoutingShift, 0u);
}

TEST_F(Commands, MasksAreKeptInUnitsThatCoverThem) {
  const struct {
    driver::Mask mask;
    u32 packed;
  } cases[] = {{{5, 80, 240, 40, 160}, 0x0A1E0514},
               {{5, 1, 9, 7, 8}, 0x00020001},
               {{5, 0, 720, 0, 576}, 0x005A0048},
               {{5, 0, 0, 0, 0}, 0},
               {{5, 100, 100, 50, 90}, 0x0C0C060B}};
  for (const auto &each : cases) {
    EXPECT_EQ(send(video_input, driver::VIN_IOC_SET_MASK, each.mask), 0);
    EXPECT_EQ(video_input_register(driver::kRegPrivacyMask + 4 * 5), each.packed);
  }
  EXPECT_EQ(video_input_register(driver::kRegPrivacyMask + 4 * 4), 0u);
}

TEST_F(Commands, DecodersTellOfCamerasAndInputs) {
  const auto status = [&](u8 chip) {
    driver::DecoderRegister record{chip, driver::kDecoderStatus, 0};
    EXPECT_EQ(send(video_input, driver::VIN_IOC_READ_TW2815, record), 0);
    return record.value;
  };
  EXPECT_EQ(status(0), 0xFF);
  EXPECT_EQ(status(3), 0x0F);
  card::unplug_camera(0);
  card::unplug_camera(13);
  card::silence_input(2);
  EXPECT_EQ(status(0), 0xBE);
  EXPECT_EQ(status(3), 0x0D);
  card::plug_camera(0);
  card::sound_input(2);
  EXPECT_EQ(status(0), 0xFF);
  card::set_decoder_register(1, driver::kDecoderStatus, 0x0E);
  card::unplug_camera(6);
  EXPECT_EQ(status(1), 0x0E) << "what a test sets holds";

  EXPECT_EQ(card::decoder_register(3, 0x3A), 128);
  EXPECT_EQ(send(video_input, driver::VIN_IOC_WRITE_TW2815, driver::DecoderRegister{3, 0x3A, 200}), 0);
  EXPECT_EQ(card::decoder_register(3, 0x3A), 200);
  EXPECT_EQ(card::decoder_register(2, 0x3A), 128);
  EXPECT_THROW(card::unplug_camera(16), std::out_of_range);
  EXPECT_THROW(card::silence_input(4), std::out_of_range);
}

TEST_F(Commands, MotionMapsAndLevels) {
  const std::vector<u16> values(64 * 64, 0x1234);
  const auto set = [&](u32 column, u32 row, u32 columns, u32 rows, const void *thresholds) {
    const driver::MotionMap map{7, column, row, columns, rows, static_cast<const u16 *>(thresholds)};
    return send(video_input, driver::VIN_IOC_SET_MOTION_MAP, map);
  };
  const auto level = [&](u32 channel) {
    driver::MotionLevels levels{};
    EXPECT_EQ(send(video_input, driver::VIN_IOC_GET_MOTION_LEVELS, levels), 0);
    return levels.level[channel];
  };
  const auto power_up = level(7);
  EXPECT_EQ(set(60, 0, 5, 1, values.data()), -EINVAL);
  EXPECT_EQ(set(0, 64, 1, 1, values.data()), -EINVAL);
  EXPECT_EQ(set(1, 0, 0xFFFFFFFF, 1, values.data()), -EINVAL);
  EXPECT_EQ(set(0, 0, 0, 1, values.data()), -EINVAL);
  EXPECT_EQ(set(0, 0, 64, 64, nullptr), -EFAULT);
  EXPECT_EQ(set(0, 0, 64, 64, no_access), -EFAULT);
  EXPECT_EQ(set(2, 3, 4, 5, values.data()), 0) << "an area";
  EXPECT_EQ(level(7), power_up);
  EXPECT_EQ(set(0, 0, 64, 64, values.data()), 0);
  EXPECT_EQ(level(7), 0x1234);
  EXPECT_EQ(level(6), power_up);
  card::set_motion_level(6, 99);
  EXPECT_EQ(level(6), 99);

  u32 bits = 0;
  card::script_motion(0x8001);
  EXPECT_EQ(send(display, driver::DISP_IOC_GET_MOTION, bits), 0);
  EXPECT_EQ(bits, 0x8001u);
}

TEST_F(Commands, TheBoardControllerAnswers) {
  EXPECT_EQ(board_command(driver::kBoardVersion), 0xBBu);
  card::set_board_version(0xDD);
  EXPECT_EQ(board_command(driver::kBoardVersion), 0xDDu);
  EXPECT_EQ(board_command(0x99), 0u);
  card::script_board_replies(driver::kBoardWatchdogOn, {0, driver::kBoardWatchdogOnReply});
  EXPECT_EQ(board_command(driver::kBoardWatchdogOn), 0u);
  EXPECT_FALSE(card::counters().watchdog_running) << "a controller that did not confirm did not act";
  EXPECT_EQ(board_command(driver::kBoardVersion), 0xDDu) << "a script is for its command only";
  EXPECT_EQ(board_command(driver::kBoardWatchdogOn), driver::kBoardWatchdogOnReply);
  EXPECT_TRUE(card::counters().watchdog_running);
}

}  // namespace
