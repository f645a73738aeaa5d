#include "sdk_test.h"

namespace vc = virtual_card;

namespace {

class Watchdog : public CardTest {
 protected:
  static Words wrong(std::size_t times) { return Words(times, 0x77); }
  /// Enables the watchdog and waits until it counts the seconds to the next kick.
  void enable_watchdog() {
    faults.clock_reads = 0;
    ASSERT_EQ(zv_EnableWatchDog(handle), ZV_OK);
    EXPECT_TRUE(eventually([] { return faults.clock_reads > 1; }));
  }
  /// The thread has run its exit path to the end.
  static bool thread_ended() {
    return eventually([] { return count(operations(), cmd(0xC008640F, {0xBE4, 0})) > 0; });
  }
};

TEST_F(Watchdog, StartsOnceFeedsAndStops) {
  enable_watchdog();
  ASSERT_EQ(zv_EnableWatchDog(handle), ZV_OK);
  faults.clock_ahead += 30;
  EXPECT_TRUE(eventually([] { return vc::counters().watchdog_kicks == 2; }));
  EXPECT_EQ(zv_DisableWatchDog(handle), ZV_OK);
  EXPECT_EQ(sent(),
            "c008640f be4 1ff; c008760a 2b 0; c008640f be4 1ff; c008760a 2b 0; "
            "c008760a 2d 0; c008640f be4 0; c008640f be4 0; c008760a 2d 0");
  EXPECT_FALSE(vc::counters().watchdog_running);
  EXPECT_EQ(zv_DisableWatchDog(handle), ZV_OK);
  EXPECT_EQ(sent(), "");
}

/// A board that answers late, or not at all, at each of the three handshakes.
TEST_F(Watchdog, HandshakesTryTenTimes) {
  vc::script_board_replies(0x2B, wrong(9));
  enable_watchdog();
  vc::script_board_replies(0x2D, wrong(10));  // the thread's own command takes the first
  EXPECT_EQ(zv_DisableWatchDog(handle), ZV_OK);

  vc::record_log(true);
  vc::script_board_replies(0x2B, wrong(10));
  EXPECT_EQ(printed_by([&] {
              EXPECT_EQ(zv_EnableWatchDog(handle), ZV_OK);
              EXPECT_TRUE(thread_ended());
            }),
            "ERROR: Zarvo WatchDog init failed. code = 0x77\n");
  EXPECT_EQ(count(issued(), cmd(0xC008760A, {0x2B, 0})), 10u);
  EXPECT_EQ(zv_DisableWatchDog(handle), ZV_OK);  // it has ended by itself: nothing to stop
  EXPECT_EQ(sent(), "");

  enable_watchdog();
  vc::script_board_replies(0x2B, wrong(10));
  EXPECT_EQ(printed_by([&] {
              faults.clock_ahead += 30;
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
  vc::set_decoder_register(0, 0x5A, 0x3F);
  EXPECT_EQ(zv_GetVideoStatus(handle), 0u);
  EXPECT_EQ(sent(), "c0037607 0 5a 0; c0037607 1 5a 0; c0037607 2 5a 0; c0037607 3 5a 0");
  vc::set_decoder_register(1, 0x5A, 0x0E);
  EXPECT_EQ(zv_GetVideoStatus(handle), 0x10u);
  EXPECT_EQ(zv_GetAudioStatus(handle), 0xCu);
  issued();
  const std::pair<std::uint32_t, u32> versions[] = {{0x00, 0}, {0xBB, 0}, {0xCC, 1}, {0xDD, 2}, {0x11, 3}};
  for (const auto &[reply, version] : versions) {
    vc::script_board_replies(0x3A, {reply});
    EXPECT_EQ(zv_GetHardwareVersion(handle), version);
    EXPECT_EQ(sent(), "c008760a 3a ff");
  }
}

TEST_F(Watchdog, RegistersPrintTheirLine) {
  u32 word = 0xABCD;
  u8 byte = 0x5E;
  EXPECT_EQ(printed_by([&] {
              zv_SetTarnRegisterValue(handle, 0x268, &word);
              zv_GetTarnRegisterValue(handle, 0x268, &(word = 0));
              zv_SetTW2815RegisterValue(handle, 2, 0x17, &byte);
              zv_GetTW2815RegisterValue(handle, 2, 0x17, &(byte = 0));
            }),
            "Tarn6400 Register 0x268 = 0xabcd.\nTarn6400 Register 0x268 = 0xabcd.\n"
            "TW2815 2 Register 0x17 = 0x5e.\nTW2815 2 Register 0x17 = 0x5e.\n");
  EXPECT_TRUE(word == 0xABCD && byte == 0x5E);
  EXPECT_EQ(zv_GetTW2815RegisterValue(handle, 4, 0x5A, &byte), ZV_ERR_DEVICE);
  EXPECT_EQ(zv_SetTW2815RegisterValue(handle, 4, 0x5A, &byte), ZV_ERR_DEVICE);
}

}  // namespace
