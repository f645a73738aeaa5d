// Tests of opening and closing the card, of bad arguments, and of the preview read.

#include <fcntl.h>
#include <unistd.h>

#include <tuple>

#include "sdk_test.h"
#include "zv_video.h"

namespace {

using Opening = SdkTest;

TEST_F(Opening, SendsTheCommandsOfOpenAndCloseInOrder) {
  ASSERT_EQ(zv_Close(handle), ZV_OK);
  card::set_codec_register(0x260, 0xFFFF1234);
  card::set_motion_level(15, 0x1234);
  issued();
  EXPECT_EQ(sent(zv_Open(&handle)),
            "open encoder; open display; open audio; open vin; mmap encoder 0x200000; "
            "DISP_IOC_SELECT_BUFFER 0; mmap display 0x240000; DISP_IOC_SELECT_BUFFER 1; "
            "mmap display 0x240000; DISP_IOC_SELECT_BUFFER 2; mmap display 0x240000; "
            "DISP_IOC_SELECT_BUFFER 3; mmap display 0x240000; VIN_IOC_GET_MOTION_LEVELS 0 0 0 0 0 0 0 0; "
            "decoder write 0 0x72 0; decoder write 0 0x73 11; decoder write 0 0x74 11; read 0x260; "
            "write 0x260 1234; write 0x268 ffff");
  EXPECT_EQ(fcntl(kept().enc_fd, F_GETFD), FD_CLOEXEC);  // a player must not hold the card
  EXPECT_EQ(kept().motion_sensitivity[15], 0x1234u);
  EXPECT_EQ(std::pair(kept().property[7].saturation, kept().property[7].contrast), std::pair(100, 100));
  EXPECT_EQ(sent(zv_Close(handle)),
            "DISP_IOC_PREVIEW_OFF; read 0x260; write 0x260 1234; DISP_IOC_MOTION_TRACE_OFF; "
            "write 0x268 ffff; close encoder; close display; close audio; close vin; "
            "munmap encoder 0x200000; munmap display 0x240000; munmap display 0x240000; "
            "munmap display 0x240000; munmap display 0x240000");
}

/// Catches: a failure half way through opening that leaks, crashes, or leaves the SDK unable to open again.
TEST_F(Opening, EveryFailureIsUndone) {
  const auto fail = [](const std::string &operation) {
    return [=](int nth) { card::apply("fail=any/" + operation + ":EIO:1:" + std::to_string(nth - 1)); };
  };
  const std::tuple<std::function<void(int)>, int, int> kinds[] = {
      {fail("open"), 4, ZV_ERR_OPEN},
      {fail("mmap"), 5, ZV_ERR_NO_MEMORY},
      {[](int nth) { faults.malloc_countdown = nth; }, 4, ZV_ERR_NO_MEMORY},
      {fail("ioctl"), 11, ZV_OK}};  // commands may fail: nothing depends on them
  ASSERT_EQ(zv_Close(handle), ZV_OK);
  for (const auto &[fail_nth, calls, failure] : kinds)
    for (int nth = 1; nth <= calls + 1; ++nth) {
      const int expected = nth <= calls ? failure : ZV_OK;
      card::apply("fail=");
      fail_nth(nth);
      handle = nullptr;
      EXPECT_EQ(printed_by([&] { EXPECT_EQ(zv_Open(&handle), expected) << nth; }),
                expected == ZV_ERR_NO_MEMORY ? "Zarvo SDK: Open Error! Error Code = 3.\n" : "");
      EXPECT_EQ(handle == nullptr, expected != ZV_OK);
      faults.malloc_countdown = 0;
      close_leaving_nothing();
      EXPECT_NE(fcntl(STDIN_FILENO, F_GETFD), -1);  // a descriptor that was never the SDK's
    }
}

/// Catches: a failed close that closes a number twice, when it may be somebody else's.
TEST_F(Opening, CloseGoesOnAfterAFailure) {
  for (int failing = 1; failing <= 4; ++failing) {
    card::apply("fail=any/close:EIO:1:" + std::to_string(failing - 1));
    EXPECT_EQ(zv_Close(handle), ZV_ERR_CLOSE);
    HANDLE second = nullptr;
    EXPECT_EQ(zv_Open(&second), ZV_ERR_ALREADY_OPEN);
    const int stranger = open("/dev/null", O_RDONLY);
    EXPECT_EQ(zv_Close(handle), ZV_OK);
    EXPECT_EQ(close(stranger), 0) << failing;
    open_card();
  }
}

/// Catches: a null, dead or foreign handle that is followed.
TEST_F(Opening, BadHandlesAreRefused) {
  HANDLE second = nullptr;
  int foreign = 0;
  u8 *picture = nullptr;
  for (HANDLE bad : {HANDLE{nullptr}, HANDLE{&foreign}}) {
    expect_all(ZV_ERR_PARAM, zv_Start(bad), zv_Close(bad), zv_SetVideoStandard(bad, 0));
    EXPECT_EQ(zv_GetPreviewScreen(bad, &picture), -1);
    EXPECT_EQ(zv_GetVideoStatus(bad), 0xFFFFu);
    EXPECT_EQ(zv_GetHardwareVersion(bad), 3u);
  }
  EXPECT_EQ(zv_Open(&second), ZV_ERR_ALREADY_OPEN);
  EXPECT_EQ(second, nullptr);
  for (int i = 0; i < 2; ++i) EXPECT_EQ(zv_Close(handle), ZV_OK);
  EXPECT_EQ(zv_Start(handle), ZV_ERR_PARAM);
}

/// Catches: a channel, mode or pointer that is used unchecked.
TEST_F(Opening, BadArgumentsAreRefusedAndSendNothing) {
  const HANDLE h = handle;
  const u32 bad = 16;
  ZV_VIDEO_CONFIG config{};
  ZV_VIDEO_PROPERTY property{};
  ZV_RECT rect{};
  u32 word = 0;
  u8 byte = 0;
  expect_all(
      ZV_ERR_CHANNEL, zv_SetVideoEncodeConfig(h, bad, &config), zv_GetVideoEncodeConfig(h, bad, &config),
      zv_set_video_config(h, bad), zv_get_video_config(h, bad), zv_EnableVideoRecordChannels(h, 0x10000),
      zv_EnablePreviewChannels(h, 0x10000), zv_EnableAudioChannels(h, 0x10), zv_GetAudioStream(h, 4),
      zv_SetFocusChannel(h, bad), zv_EnableVideoChannelNumber(h, bad), zv_DisableVideoChannelNumber(h, bad),
      zv_SetVideoProperty(h, bad, &property), zv_GetVideoProperty(h, bad, &property),
      zv_SetMotionSensitivity(h, bad, 1), zv_GetMotionSensitivity(h, bad, &word),
      zv_MarkMotionArea(h, bad, &rect, 1), zv_SetShieldRect(h, bad, &rect), zv_GetShieldRect(h, bad, &rect));
  expect_all(ZV_ERR_PARAM, zv_Open(nullptr), zv_SetVideoEncodeConfig(h, 0, nullptr),
             zv_GetVideoEncodeConfig(h, 0, nullptr), zv_SetVideoProperty(h, 0, nullptr),
             zv_GetVideoProperty(h, 0, nullptr), zv_MarkMotionArea(h, 0, nullptr, 1),
             zv_GetMotionSensitivity(h, 0, nullptr), zv_SetShieldRect(h, 0, nullptr),
             zv_GetShieldRect(h, 0, nullptr), zv_SetMotionSensitivity(h, 0, 0x10000),
             zv_GetTarnRegisterValue(h, 0, nullptr), zv_SetTarnRegisterValue(h, 0, nullptr),
             zv_GetTW2815RegisterValue(h, 0, 0, nullptr), zv_SetTW2815RegisterValue(h, 0, 0, nullptr));
  expect_all(ZV_ERR_DEVICE, zv_GetTW2815RegisterValue(h, 4, 0x5A, &byte),
             zv_SetTW2815RegisterValue(h, 4, 0x5A, &byte));
  EXPECT_EQ(zv_SetVideoStandard(h, 2), ZV_ERR_STANDARD);
  EXPECT_EQ(zv_SetResolution(h, 2), ZV_ERR_RESOLUTION);
  EXPECT_EQ(zv_SetPreviewMode(h, 6), ZV_ERR_MODE);
  EXPECT_EQ(zv_GetPreviewScreen(h, nullptr), -1);
  EXPECT_EQ(sent(), "");
}

/// Catches: a picture taken from an index or a result the driver got wrong.
TEST_F(Opening, PreviewScreenBelievesOnlyWhatFits) {
  for (const auto &[index, result] :
       {std::pair(0u, 691200L), {3, 0x240000}, {4, 691200}, {~0u, 10}, {1, 0}, {1, 0x240001}, {2, -1}}) {
    if (kReadsAreWatched && result > 0x240000) continue;
    u8 *picture = nullptr;
    card::queue_preview(index, result);
    EXPECT_EQ(zv_GetPreviewScreen(handle, &picture), result);
    const bool fits = index < 4 && result > 0 && result <= 0x240000;
    EXPECT_EQ(picture, fits ? zarvo::preview_buf[index] : nullptr) << index;
    EXPECT_EQ(sent(), "read display 0x240000");
  }
}

}  // namespace
