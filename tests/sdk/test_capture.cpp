#include <atomic>

#include "sdk_test.h"

namespace vc = virtual_card;
using testing::ElementsAre;
using testing::UnorderedElementsAre;
using namespace std::chrono_literals;

namespace {

class Capture : public CardTest {
 protected:
  /// Frames and blocks without end, as fast as they are read.
  void start_endless() {
    vc::Supply supply;
    supply.mpeg4 = {vc::mpeg4_frame(2, 1, Bytes(500, 0x55))};
    supply.mjpeg = {vc::mjpeg_frame(2, 352, 240, {1, 2, 0xFF, 0xD9})};
    supply.audio = {{Bytes(192, 7), 4}};
    vc::set_supply(supply);
    enable(1u << 2);
    EXPECT_EQ(zv_EnableAudioChannels(handle, 0xF), ZV_OK);
    ASSERT_EQ(zv_Start(handle), ZV_OK);
  }
};

TEST_F(Capture, FramesArriveWithHeaderFlagsAndPlace) {
  enable(0xFFFF & ~(1u << 9));
  const Bytes stream(1000, 0xAB);
  Bytes scan(5000, 0x11);
  scan[4996] = 0xFF;
  scan[4997] = 0xD9;  // and two bytes of padding
  scan[1234] = 0xD9;  // inside the data, to be left alone
  // An intra frame of channel 9 gets no header, since the channel has no scale.
  for (const auto &[channel, type] :
       {std::pair(3u, 0u), std::pair(9u, 0u), std::pair(9u, 1u), std::pair(3u, 2u)})
    vc::queue_mpeg4(vc::mpeg4_frame(channel, type, stream, 1s));
  vc::queue_mjpeg(vc::mjpeg_frame(4, 352, 240, scan));
  vc::script_motion(1u << 3);
  vc::set_decoder_register(0, 0x5A, 0xF7);
  ASSERT_EQ(zv_Start(handle), ZV_OK);
  ASSERT_TRUE(wait_for_deliveries(4));
  ASSERT_EQ(zv_Stop(handle), ZV_OK);
  EXPECT_THAT(summaries(), UnorderedElementsAre("m 3 44 1020 10001", "m 9 64 1000 0", "m 3 64 1000 10001",
                                                "j 4 447 5591 0"));
  scan.resize(4998);
  for (const Delivery &got : deliveries()) {
    const bool jpeg = got.summary[0] == 'j';
    const Bytes &end = jpeg ? scan : stream;
    ASSERT_GE(got.data.size(), end.size());
    EXPECT_TRUE(std::equal(end.rbegin(), end.rend(), got.data.rbegin()));
    EXPECT_TRUE(!jpeg || std::equal(&got.data[565], &got.data[569], Bytes{0, 240, 1, 96}.begin()));
  }
  EXPECT_EQ(card().config[3].scale, SCALE_ZV_NO_ENCODE);
}

/// A card polled at every frame, or flags that are never refreshed.
TEST_F(Capture, StatusIsPolledEachTenthOfASecondOfCaptureTime) {
  enable(1);
  for (const auto time : {5000000us, 5050000us, 5099999us, 5100000us})
    vc::queue_mpeg4(vc::mpeg4_frame(0, 1, Bytes(10, 1), time));
  vc::script_motion(1);
  on_delivery = [](const Delivery &) { vc::script_motion(0); };
  ASSERT_EQ(zv_Start(handle), ZV_OK);
  ASSERT_TRUE(wait_for_deliveries(4));
  const std::string moving = "m 0 64 10 10000";
  EXPECT_THAT(summaries(), ElementsAre(moving, moving, moving, "m 0 64 10 0"));
  EXPECT_EQ(count(issued(), cmd(0x80046412, {0})), 1u);  // the second asks with the bits it had
}

TEST_F(Capture, StartAndStopSendTheirCommandsOnce) {
  enable(1u << 2);
  vc::set_codec_register(0x310, 0x5);
  for (int i = 0; i < 2; ++i) ASSERT_EQ(zv_Start(handle), ZV_OK);
  ASSERT_TRUE(eventually([] { return count(operations(), cmd(0x6512)) > 0; }));
  for (int i = 0; i < 2; ++i) ASSERT_EQ(zv_Stop(handle), ZV_OK);
  const auto log = vc::log();
  const Lines all = operations(), lines = issued();
  EXPECT_THAT(Lines(lines.begin(), lines.begin() + 3),
              ElementsAre("c008640e 310 0", "c008640f 310 80000005", "00006512"));
  ASSERT_EQ(lines.size(), 3 + 16 * 5 + 1u);
  EXPECT_EQ(lines[3 + 2 * 5], "40086500 2 0");
  EXPECT_EQ(lines.back(), "00006510");
  // Every pass: request, read, done, read; and no audio read without an enabled input.
  EXPECT_EQ(count(all, "0000650f"), count(all, "00006509"));
  EXPECT_EQ(count(all, "read audio"), 0u);
  for (const vc::Call &command : log)
    EXPECT_TRUE(command.value == 0 || (command.code != 0x6510 && command.operation != vc::Operation::read));
}

TEST_F(Capture, StartRefusesAndRecovers) {
  for (u32 channel = 0; channel < 5; ++channel) card().config[channel].scale = SCALE_ZV_D1;
  int status = -1;
  EXPECT_NE(printed_by([&] { status = zv_Start(handle); }), "");
  EXPECT_EQ(status, ZV_ERR_CONFIG);
  EXPECT_EQ(zarvo::start_flag, 0);
  for (int thread : {1, 2}) {
    enable(1);
    faults.thread_countdown = thread;
    EXPECT_EQ(printed_by([&] { status = zv_Start(handle); }), "Zarvo SDK: Start Error! Error Code = 12.\n");
    EXPECT_EQ(status, ZV_ERR_THREAD_CREATE);
    EXPECT_EQ(card().config[0].scale, SCALE_ZV_NO_ENCODE);
    EXPECT_EQ(count(issued(), "00006510"), 1u);
  }
  enable(1);
  EXPECT_EQ(zv_Start(handle), ZV_OK);
}

TEST_F(Capture, AudioBlocksOfTheMaskOnly) {
  Bytes blocks;
  for (u8 n = 0; n < 4; ++n) blocks.insert(blocks.end(), 48, n);
  EXPECT_EQ(zv_EnableAudioChannels(handle, 0x5), ZV_OK);
  vc::queue_audio({blocks, 0});  // no data yet: tried again
  vc::queue_audio({blocks, 4});
  vc::queue_audio({blocks, 192});
  ASSERT_EQ(zv_Start(handle), ZV_OK);
  ASSERT_TRUE(wait_for_deliveries(4));
  ASSERT_EQ(zv_Stop(handle), ZV_OK);
  EXPECT_THAT(summaries(), ElementsAre("a 0 0 48 0", "a 2 96 48 0", "a 0 0 48 0", "a 2 96 48 0"));
  EXPECT_EQ(deliveries()[3].data, Bytes(48, 2));
}

/// A callback after zv_Stop() has returned writes into files that are closed.
TEST_F(Capture, NothingArrivesAfterStop) {
  std::atomic<bool> inside{false};
  on_delivery = [&](const Delivery &got) {
    if (got.summary[0] != 'm' || inside.exchange(true)) return;
    EXPECT_TRUE(eventually([] { return zarvo::start_flag == 0; }));
  };
  for (int round = 0; round < 3; ++round) {
    inside = false;
    start_endless();
    EXPECT_TRUE(eventually([&] { return inside.load(); }));
    EXPECT_EQ(zv_Stop(handle), ZV_OK);
    const std::size_t number = deliveries().size();
    EXPECT_EQ(zv_Stop(handle), ZV_OK);
    EXPECT_EQ(deliveries().size(), number);
  }
}

/// A stop from inside a callback that waits for itself for ever; a start that lets the thread of before,
/// which is still in that callback, run on.
TEST_F(Capture, StopFromACallbackEndsCaptureAndItStartsAgain) {
  std::atomic<char> stopper{0};
  std::atomic<int> status{-1};
  on_delivery = [&](const Delivery &got) {
    char stream = got.summary[0];
    if (!stopper.compare_exchange_strong(stream, 0)) return;
    status = zv_Stop(handle);
    EXPECT_TRUE(eventually([] { return zarvo::start_flag != 0; }));
  };
  for (char stream : {'m', 'j', 'a', 'm'}) {
    start_endless();
    status = -1;
    stopper = stream;
    EXPECT_TRUE(eventually([&] { return status != -1; }));
    EXPECT_EQ(status, ZV_ERR_THREAD_JOIN);
  }
  start_endless();
  EXPECT_TRUE(wait_for_deliveries(deliveries().size() + 10));
  EXPECT_EQ(zv_Stop(handle), ZV_OK);  // while what the callbacks look at is still there
}

/// A close that waits for threads it has not told to end, or takes the card from under them.
TEST_F(Capture, CloseWhileCapturingLeavesNothing) {
  close_leaving_nothing();
  std::thread([] {}).join();  // a sanitizer brings up a thread of its own with the first
  const std::size_t threads = entries("/proc/self/task");
  for (int round = 0; round < 3; ++round) {
    open_card();
    start_endless();
    EXPECT_EQ(zv_EnableWatchDog(handle), ZV_OK);
    EXPECT_TRUE(wait_for_deliveries(deliveries().size() + 10));
    close_leaving_nothing();
    EXPECT_TRUE(eventually([&] { return entries("/proc/self/task") <= threads; }));
  }
}

/// Control calls and callbacks changed under a running capture: a race, or a callback through a
/// torn pointer.
TEST_F(Capture, ControlWhileCapturing) {
  start_endless();
  std::thread preview([&] {
    u8 *picture = nullptr;
    for (int i = 0; i < 20; ++i) zv_GetPreviewScreen(handle, &picture);
  });
  for (u32 i = 0; i < 50; ++i) {
    zv_RegisterCallBack(handle, i % 2 == 0 ? nullptr : callback<'m'>, nullptr, callback<'a'>);
    zv_EnableAudioChannels(handle, i % 16);
    zv_SetVideoStandard(handle, i % 2);
    zv_GetMotionStatus(handle);
  }
  preview.join();
  EXPECT_TRUE(wait_for_deliveries(10));
}

}  // namespace
