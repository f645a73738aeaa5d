// Signals of the host while the SDK talks to the card.

#include <sys/time.h>

#include <csignal>

#include "sdk_test.h"
#include "zv_display.h"

namespace {

std::atomic<int> signals{0};
std::atomic<int> signals_elsewhere{0};  // handled on a thread that is not the test's
thread_local bool is_host = false;

void on_alarm(int) {
  ++signals;
  if (!is_host) ++signals_elsewhere;
}

/// 200 signals a second, which interrupt calls, while it exists.
class Storm {
 public:
  Storm() {
    is_host = true;
    struct sigaction action {};
    action.sa_handler = on_alarm;  // without SA_RESTART
    sigaction(SIGALRM, &action, &before_);
    const itimerval every{{0, 5000}, {0, 5000}};
    setitimer(ITIMER_REAL, &every, nullptr);
  }
  ~Storm() {
    const itimerval never{};
    setitimer(ITIMER_REAL, &never, nullptr);
    sigaction(SIGALRM, &before_, nullptr);
  }
  Storm(const Storm &) = delete;
  Storm &operator=(const Storm &) = delete;

 private:
  struct sigaction before_ {};
};

/// Makes each of the calls that read a register, change some bits and write it back, and those that only ask.
void call_all(HANDLE handle, u32 round) {
  u32 word = 0;
  ZV_VIDEO_PROPERTY property{};
  const ZV_RECT block{0, 0, 16, 16};
  EXPECT_EQ(zv_SetVideoStandard(handle, round % 2), ZV_OK);
  EXPECT_EQ(zv_SetResolution(handle, round / 2 % 2), ZV_OK);
  EXPECT_EQ(zv_SetFocusChannel(handle, round % 16), ZV_OK);
  EXPECT_EQ(zv_SetFocusChannel(handle, 0), ZV_OK);
  EXPECT_EQ(zv_StartMotionDetection(handle), ZV_OK);
  EXPECT_EQ(zv_StopMotionDetection(handle), ZV_OK);
  EXPECT_EQ(zv_SetPreviewMode(handle, round % 6), ZV_OK);
  EXPECT_EQ(zv_EnablePreviewChannels(handle, 0xFFFF), ZV_OK);
  EXPECT_EQ(zv_GetVideoProperty(handle, round % 16, &property), ZV_OK);
  EXPECT_EQ(zv_SetVideoProperty(handle, round % 16, &property), ZV_OK);
  EXPECT_EQ(zv_MarkMotionArea(handle, round % 16, &block, 1), ZV_OK);
  EXPECT_EQ(zv_SetShieldRect(handle, round % 16, &block), ZV_OK);
  EXPECT_EQ(zv_GetMotionSensitivity(handle, round % 16, &word), ZV_OK);
  EXPECT_EQ(zv_EnableVideoChannelNumber(handle, round % 16), ZV_OK);
  EXPECT_EQ(zv_GetVideoStatus(handle), 0x10u);
  EXPECT_EQ(zv_GetAudioStatus(handle), 0u);
  EXPECT_EQ(zv_GetMotionStatus(handle), 5u);
  EXPECT_EQ(zv_GetHardwareVersion(handle), 0u);
}

// Catches: an interrupted read of a register that counts as 0 and is written back; a status that says 0 at
// random; the host's handler on a thread of the SDK.
TEST_F(SdkTest, AStormOfSignalsChangesNothing) {
  constexpr u32 kRounds = 560;  // more than 10,000 calls
  card::apply("lost=5;fail=any/ioctl:EINTR:every3;fail=any/read:EINTR:every5");
  card::script_motion(5);
  card::set_codec_register(driver::kRegMotionEnable, 0x00AA0055);
  const u32 display_before = card::codec_register(driver::kRegDisplayState);
  std::vector<u32> routing;
  for (u32 n = 0; n < ZV_CHANNELS; ++n) {
    const u32 address = driver::kRegRouting + 4 * n;
    card::set_video_input_register(address, card::video_input_register(address) | 0x5A5A);
    routing.push_back(card::video_input_register(address));
  }
  enable(0xFFFF);
  ASSERT_EQ(zv_Start(handle), ZV_OK);
  {
    const Storm storm;
    for (u32 round = 0; round < kRounds && !HasFailure(); ++round) call_all(handle, round);
    // However fast the calls were: signals have come.
    EXPECT_TRUE(eventually([] { return signals > 20; }));
  }
  EXPECT_EQ(zv_Stop(handle), ZV_OK);
  EXPECT_EQ(signals_elsewhere, 0);
  EXPECT_EQ(card::codec_register(driver::kRegMotionEnable), 0x55u);
  EXPECT_EQ(card::codec_register(driver::kRegDisplayState) >> 31, display_before >> 31);
  for (u32 n = 0; n < ZV_CHANNELS; ++n)
    EXPECT_EQ(card::video_input_register(driver::kRegRouting + 4 * n) & 0xFFFF, routing[n] & 0xFFFF) << n;
  EXPECT_GT(card::counters().failed_calls, 10'000u);
}

}  // namespace
