#include "sdk_test.h"

namespace vc = virtual_card;
using testing::ElementsAre;
using testing::ElementsAreArray;

namespace {

class Watchdog : public CardTest {
 protected:
  static std::vector<std::uint32_t> wrong(std::size_t times) {
    return std::vector<std::uint32_t>(times, 0x77);
  }
  /// The thread has run its exit path to the end.
  static bool thread_ended() {
    return eventually([] { return count(operations(), cmd(0xC008640F, {0xBE4, 0})) > 0; });
  }
};

const Lines kOn = {cmd(0xC008640F, {0xBE4, 0x1FF}), cmd(0xC008760A, {0x2B, 0})};
const Lines kOff = {cmd(0xC008760A, {0x2D, 0}), cmd(0xC008640F, {0xBE4, 0})};

TEST_F(Watchdog, StartsOnceFeedsAndStops) {
  ASSERT_EQ(zv_EnableWatchDog(handle), ZV_OK);
  ASSERT_EQ(zv_EnableWatchDog(handle), ZV_OK);
  EXPECT_TRUE(eventually([] { return vc::counters().watchdog_kicks == 1; }));
  faults.clock_ahead_ms += 30000;
  EXPECT_TRUE(eventually([] { return vc::counters().watchdog_kicks == 2; }));
  EXPECT_EQ(zv_DisableWatchDog(handle), ZV_OK);
  Lines expected = kOn;
  for (const Lines &more : {kOn, kOff, Lines{kOff[1], kOff[0]}})
    expected.insert(expected.end(), more.begin(), more.end());
  EXPECT_THAT(issued(), ElementsAreArray(expected));
  EXPECT_FALSE(vc::counters().watchdog_running);
  EXPECT_EQ(zv_DisableWatchDog(handle), ZV_OK);
  EXPECT_THAT(issued(), testing::IsEmpty());
}

/// A board that answers late, or not at all, at each of the three handshakes.
TEST_F(Watchdog, HandshakesTryTenTimes) {
  vc::script_board_replies(0x2B, wrong(9));
  ASSERT_EQ(zv_EnableWatchDog(handle), ZV_OK);
  EXPECT_TRUE(eventually([] { return vc::counters().watchdog_running; }));
  vc::script_board_replies(0x2D, wrong(10));  // the thread's own command takes the first
  EXPECT_EQ(zv_DisableWatchDog(handle), ZV_OK);

  vc::record_log(true);
  vc::script_board_replies(0x2B, wrong(10));
  EXPECT_EQ(printed([&] {
              EXPECT_EQ(zv_EnableWatchDog(handle), ZV_OK);
              EXPECT_TRUE(thread_ended());
            }),
            "ERROR: Zarvo WatchDog init failed. code = 0x77\n");
  EXPECT_EQ(count(issued(), cmd(0xC008760A, {0x2B, 0})), 10u);
  EXPECT_EQ(zv_DisableWatchDog(handle), ZV_OK);  // it has ended by itself: nothing to stop
  EXPECT_THAT(issued(), testing::IsEmpty());

  ASSERT_EQ(zv_EnableWatchDog(handle), ZV_OK);
  EXPECT_TRUE(eventually([] { return vc::counters().watchdog_running; }));
  vc::script_board_replies(0x2B, wrong(10));
  EXPECT_EQ(printed([&] {
              faults.clock_ahead_ms += 30000;
              EXPECT_TRUE(thread_ended());
            }),
            "ERROR: Zarvo WatchDog reset failed. code = 0x77.\n");

  ASSERT_EQ(zv_EnableWatchDog(handle), ZV_OK);
  vc::script_board_replies(0x2D, wrong(11));
  EXPECT_EQ(zv_DisableWatchDog(handle), ZV_ERR_DEVICE);
  faults.thread_countdown = 1;
  EXPECT_EQ(zv_EnableWatchDog(handle), ZV_ERR_THREAD_CREATE);
  EXPECT_EQ(zv_DisableWatchDog(handle), ZV_OK);
}

TEST_F(Watchdog, StatusAndVersion) {
  for (unsigned chip = 0; chip < 4; ++chip) vc::set_decoder_register(chip, 0x5A, 0x3F);
  EXPECT_EQ(zv_GetVideoStatus(handle), 0u);
  EXPECT_THAT(issued(), ElementsAre(cmd(0xC0037607, {0, 0x5A, 0}), cmd(0xC0037607, {1, 0x5A, 0}),
                                    cmd(0xC0037607, {2, 0x5A, 0}), cmd(0xC0037607, {3, 0x5A, 0})));
  vc::set_decoder_register(1, 0x5A, 0x0E);
  EXPECT_EQ(zv_GetVideoStatus(handle), 0x10u);
  EXPECT_EQ(zv_GetAudioStatus(handle), 0xCu);
  issued();
  const std::pair<std::uint32_t, u32> versions[] = {{0x00, 0}, {0xBB, 0}, {0xCC, 1}, {0xDD, 2}, {0x11, 3}};
  for (const auto &[reply, version] : versions) {
    vc::script_board_replies(0x3A, {reply});
    EXPECT_EQ(zv_GetHardwareVersion(handle), version);
    EXPECT_THAT(issued(), ElementsAre(cmd(0xC008760A, {0x3A, 0xFF})));
  }
  vc::inject({.operation = vc::Operation::ioctl, .code = 0xC008760A});
  EXPECT_EQ(zv_GetHardwareVersion(handle), 3u);
}

TEST_F(Watchdog, RegistersPrintTheirLine) {
  u32 word = 0xABCD;
  u8 byte = 0x5E;
  EXPECT_EQ(printed([&] { EXPECT_EQ(zv_SetTarnRegisterValue(handle, 0x268, &word), ZV_OK); }),
            "Tarn6400 Register 0x268 = 0xabcd.\n");
  word = 0;
  EXPECT_EQ(printed([&] { EXPECT_EQ(zv_GetTarnRegisterValue(handle, 0x268, &word), ZV_OK); }),
            "Tarn6400 Register 0x268 = 0xabcd.\n");
  EXPECT_EQ(word, 0xABCDu);
  EXPECT_EQ(printed([&] { EXPECT_EQ(zv_SetTW2815RegisterValue(handle, 2, 0x17, &byte), ZV_OK); }),
            "TW2815 2 Register 0x17 = 0x5e.\n");
  byte = 0;
  EXPECT_EQ(printed([&] { EXPECT_EQ(zv_GetTW2815RegisterValue(handle, 2, 0x17, &byte), ZV_OK); }),
            "TW2815 2 Register 0x17 = 0x5e.\n");
  EXPECT_EQ(byte, 0x5E);
  issued();
  EXPECT_EQ(zv_GetTW2815RegisterValue(handle, 4, 0x5A, &byte), ZV_ERR_DEVICE);
  EXPECT_EQ(zv_SetTW2815RegisterValue(handle, 4, 0x5A, &byte), ZV_ERR_DEVICE);
  EXPECT_THAT(issued(), testing::IsEmpty());
}

}  // namespace
