// Tests of the watchdog, the status queries and the raw register access.

#include <stdio_ext.h>

#include "sdk_test.h"

namespace {

class Watchdog : public SdkTest {
 protected:
  static std::vector<std::uint32_t> wrong(std::size_t times) { return std::vector(times, 0x77u); }
  /// Moves the clock on and waits until the watchdog's thread has looked at it, and acted.
  static void pass(long ms) {
    faults.clock_ms += ms;
    faults.clock_reads = 0;
    EXPECT_TRUE(eventually([] { return faults.clock_reads > 2; }));
  }
  void enable_watchdog() {
    EXPECT_EQ(zv_EnableWatchDog(handle), ZV_OK);
    pass(0);
  }
  /// What is printed until the thread has ended by itself.
  template <typename Action>
  static std::string last_words(Action action) {
    card::record_log(true);
    return printed_by([&] {
      action();
      EXPECT_TRUE(eventually([] { return count(operations(), "write 0xbe4 0") > 0; }));
    });
  }
};

/// Catches: a period counted in the wrong unit; a second thread; a controller left running.
TEST_F(Watchdog, StartsOnceFeedsEveryThirtySecondsAndStops) {
  faults.clock_ms = 1000;
  enable_watchdog();
  enable_watchdog();
  for (unsigned kicks : {1u, 2u}) {
    pass(29999);
    EXPECT_EQ(card::counters().watchdog_kicks, kicks);
    pass(1);
    EXPECT_EQ(card::counters().watchdog_kicks, kicks + 1);
  }
  EXPECT_EQ(sent(zv_DisableWatchDog(handle)),
            "write 0xbe4 1ff; board 0x2b; write 0xbe4 1ff; board 0x2b; write 0xbe4 1ff; board 0x2b; "
            "board 0x2d; write 0xbe4 0; write 0xbe4 0; board 0x2d");
  EXPECT_FALSE(card::counters().watchdog_running);
  EXPECT_EQ(sent(zv_DisableWatchDog(handle)), "");
}

/// Catches: a watchdog that gives up too early, or goes on, when the board answers late or not at all.
TEST_F(Watchdog, HandshakesTryTenTimes) {
  card::script_board_replies(0x2B, wrong(9));
  enable_watchdog();
  card::script_board_replies(0x2D, wrong(10));  // the thread's own command takes the first
  EXPECT_EQ(zv_DisableWatchDog(handle), ZV_OK);

  card::script_board_replies(0x2B, wrong(10));
  EXPECT_EQ(last_words([&] { EXPECT_EQ(zv_EnableWatchDog(handle), ZV_OK); }),
            "ERROR: Zarvo WatchDog init failed. code = 0x77\n");
  EXPECT_EQ(count(issued(), "board 0x2b"), 10u);
  EXPECT_EQ(sent(zv_DisableWatchDog(handle)), "");  // it has ended by itself: nothing to stop

  enable_watchdog();
  card::script_board_replies(0x2B, wrong(10));
  EXPECT_EQ(last_words([] { faults.clock_ms += 30000; }),
            "ERROR: Zarvo WatchDog reset failed. code = 0x77.\n");

  enable_watchdog();
  card::script_board_replies(0x2D, wrong(11));
  EXPECT_EQ(zv_DisableWatchDog(handle), ZV_ERR_DEVICE);
}

/// Catches: a run flag kept without a thread, so that the next enable feeds nothing.
TEST_F(Watchdog, CanBeEnabledAfterAFailedThread) {
  faults.thread_countdown = 1;
  EXPECT_EQ(zv_EnableWatchDog(handle), ZV_ERR_THREAD_CREATE);
  EXPECT_EQ(sent(zv_DisableWatchDog(handle)), "");
  enable_watchdog();
}

TEST_F(Watchdog, StatusAndVersion) {
  card::set_decoder_register(0, 0x5A, 0x3F);
  EXPECT_EQ(zv_GetVideoStatus(handle), 0u);
  EXPECT_EQ(sent(), "decoder read 0 0x5a; decoder read 1 0x5a; decoder read 2 0x5a; decoder read 3 0x5a");
  card::set_decoder_register(1, 0x5A, 0x0E);
  EXPECT_EQ(zv_GetVideoStatus(handle), 0x10u);
  EXPECT_EQ(zv_GetAudioStatus(handle), 0xCu);
  const std::pair<std::uint32_t, u32> versions[] = {{0x00, 0}, {0xBB, 0}, {0xCC, 1}, {0xDD, 2}, {0x11, 3}};
  for (const auto &[reply, version] : versions) {
    card::script_board_replies(0x3A, {reply});
    EXPECT_EQ(zv_GetHardwareVersion(handle), version);
  }
  for (const auto &[error, version] : {std::pair("EINTR", 0u), {"EIO", 3u}}) {  // EINTR: asked again
    card::apply(std::string("fail=any/ioctl:") + error + ":1");
    EXPECT_EQ(zv_GetHardwareVersion(handle), version);
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
              EXPECT_EQ(__fpending(stdout), 0u);  // who reads a pipe sees the lines at once
            }),
            "Tarn6400 Register 0x268 = 0xabcd.\nTarn6400 Register 0x268 = 0xabcd.\n"
            "TW2815 2 Register 0x17 = 0x5e.\nTW2815 2 Register 0x17 = 0x5e.\n");
  EXPECT_TRUE(word == 0xABCD && byte == 0x5E);
}

}  // namespace
