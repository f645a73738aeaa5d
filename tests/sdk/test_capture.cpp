// Tests of capture: what the callbacks get of sound and of malformed frames, and stops at awkward moments.

#include <climits>
#include <csignal>
#include <cstring>
#include <random>

#include "sdk_test.h"
#include "stream_headers.h"

using testing::UnorderedElementsAre;

namespace {

/// First words of an MPEG-4 descriptor for channel 3, without the length; all bits without a meaning are set.
constexpr u32 kIntra = 0xF3300000;
constexpr u32 kPredicted = 0xF3700000;

/// A frame as the driver describes it; `head` is the first word of its descriptor.
card::ReadyFrame mpeg4(u32 head, Bytes stream, u32 seconds = 0, u32 microseconds = 0) {
  stream.insert(stream.begin(), 64, 0);
  std::memcpy(&stream[0], &head, sizeof head);
  std::memcpy(&stream[20], &seconds, sizeof seconds);
  std::memcpy(&stream[24], &microseconds, sizeof microseconds);
  return {stream, 1};
}

card::ReadyFrame mjpeg(u32 channel, Bytes scan, long result) {
  scan.insert(scan.begin(), {0, 0, 0, 0, 0x60, 1, 0, 0, 240, 0, 0, 0, 0, 0, 0, 0});  // 352 x 240
  std::memcpy(&scan[0], &channel, sizeof channel);
  return {scan, result};
}

class Capture : public SdkTest {
 protected:
  /// Captures until all of `last` have been delivered.
  Lines capture(const Lines &last) {
    EXPECT_EQ(zv_Start(handle), ZV_OK);
    EXPECT_TRUE(eventually([&] { return testing::Value(delivered(), testing::IsSupersetOf(last)); }));
    EXPECT_EQ(zv_Stop(handle), ZV_OK);
    return delivered();
  }
  static void wait_for_ten_more() {
    EXPECT_TRUE(eventually([end = delivered().size() + 10] { return delivered().size() >= end; }));
  }
  /// Starts with frames and blocks without end, as fast as they are read.
  void start_endless() {
    card::Supply supply;
    supply.mpeg4 = {mpeg4(kPredicted | 500, Bytes(500, 0x55))};
    supply.mjpeg = {mjpeg(2, {1, 2, 0xFF, 0xD9}, 20)};
    supply.audio = {{Bytes(192, 7), 4}};
    card::set_supply(supply);
    enable(1);
    EXPECT_EQ(zv_EnableAudioChannels(handle, 0xF), ZV_OK);
    ASSERT_EQ(zv_Start(handle), ZV_OK);
  }
};

TEST_F(Capture, FramesArriveWithHeaderFlagsAndPlace) {
  enable(0xFFFF & ~(1u << 9));
  const Bytes stream(1000, 0xAB);
  card::queue_mpeg4(mpeg4(kIntra | 1000, stream));
  // Channel 9 has no scale: its intra frame gets no header, and is neither delivered nor released.
  for (const u32 head : {0xF9300000, 0xF9700000}) card::queue_mpeg4(mpeg4(head | 1000, stream));
  card::queue_mpeg4(mpeg4(0xF3B00000 | 66051, Bytes(66051)));
  Bytes scan(5000, 0x11);
  scan[1234] = 0xD9;  // inside the data, to be left alone
  scan[4996] = 0xFF;
  scan[4997] = 0xD9;  // and two bytes of padding
  card::queue_mjpeg(mjpeg(4, scan, 5016));
  card::script_motion(1u << 3);
  card::set_decoder_register(0, 0x5A, 0xF7);
  card::set_decoder_register(1, 0x5A, 0xFE);
  ASSERT_THAT(
      capture({"m 3 64 66051 10001", "j 4 447 5591 1"}),
      UnorderedElementsAre("m 3 44 1020 10001", "m 9 64 1000 0", "m 3 64 66051 10001", "j 4 447 5591 1"));
  const Bytes intra = data_of("m 3 44 1020 10001"), jpeg = data_of("j 4 447 5591 1");
  EXPECT_TRUE(std::equal(intra.begin(), intra.begin() + 20, zarvo::g_mpeg4_header.begin()));
  EXPECT_EQ(Bytes(intra.begin() + 20, intra.end()), stream);
  EXPECT_EQ(data_of("m 9 64 1000 0"), stream);
  EXPECT_EQ(Bytes(&jpeg[565], &jpeg[569]), (Bytes{0, 240, 1, 96}));
  EXPECT_EQ(Bytes(jpeg.begin() + 593, jpeg.end()), Bytes(scan.begin(), scan.end() - 2));
  EXPECT_EQ(count(operations(), "ENC_IOC_MPEG4_REQUEST"), count(operations(), "ENC_IOC_MPEG4_DONE") + 1);
  EXPECT_EQ(kept().config[3].scale, SCALE_ZV_NO_ENCODE);
}

/// Catches: a card polled at every frame, or flags that are never refreshed.
TEST_F(Capture, StatusIsPolledEachTenthOfASecondOfCaptureTime) {
  enable(1);
  for (const u32 microseconds : {0u, 50000u, 99999u, 100000u})
    card::queue_mpeg4(mpeg4(kPredicted | 10, Bytes(10), 5, microseconds));
  card::script_motion(1 << 3);
  const auto signals_blocked = [] {
    sigset_t blocked;
    pthread_sigmask(SIG_BLOCK, nullptr, &blocked);
    return sigismember(&blocked, SIGINT) == 1;
  };
  on_delivery = [&](const std::string &) {
    card::script_motion(0);
    EXPECT_TRUE(signals_blocked());
  };
  const std::string moving = "m 3 64 10 10000", still = "m 3 64 10 0";
  EXPECT_THAT(capture({still}), ElementsAre(moving, moving, moving, still));
  EXPECT_FALSE(signals_blocked());
  EXPECT_EQ(count(issued(), "DISP_IOC_GET_MOTION 8"), 1u);  // the second asks with the bits it had
}

TEST_F(Capture, StartAndStopSendTheirCommandsOnce) {
  enable(1u << 2);
  card::set_codec_register(0x310, 0x5);
  for (int i = 0; i < 2; ++i) ASSERT_EQ(zv_Start(handle), ZV_OK);
  ASSERT_TRUE(eventually([] { return count(operations(), "ENC_IOC_START") > 0; }));
  for (int i = 0; i < 2; ++i) ASSERT_EQ(zv_Stop(handle), ZV_OK);
  const Lines all = operations();
  // Every pass: request, read, done, read; and no audio read without an enabled input.
  for (const char *other : {"ENC_IOC_MPEG4_DONE", "read encoder 0x100000", "read encoder 0xffc00"})
    EXPECT_EQ(count(all, "ENC_IOC_MPEG4_REQUEST"), count(all, other));
  EXPECT_EQ(count(all, "read audio 0x4"), 0u);
  for (const card::Call &call : card::log())
    EXPECT_TRUE(call.value == 0 ||
                (call.code != driver::ENC_IOC_STOP && call.operation != card::Operation::read));
  const Lines lines = issued();
  ASSERT_EQ(lines.size(), 3 + 16 * 5 + 1u);
  EXPECT_THAT(Lines(lines.begin(), lines.begin() + 3),
              ElementsAre("read 0x310", "write 0x310 80000005", "ENC_IOC_START"));
  EXPECT_EQ(lines[3 + 2 * 5], "ENC_IOC_SET_SCALE 2 0");
  EXPECT_EQ(lines.back(), "ENC_IOC_STOP");
}

TEST_F(Capture, StartRefusesAndRecovers) {
  for (u32 channel = 0; channel < 5; ++channel) kept().config[channel].scale = SCALE_ZV_D1;
  EXPECT_NE(printed_by([&] { EXPECT_EQ(zv_Start(handle), ZV_ERR_CONFIG); }), "");
  EXPECT_EQ(zarvo::start_flag, 0);
  for (int thread : {1, 2}) {
    enable(1);
    faults.thread_countdown = thread;
    EXPECT_EQ(printed_by([&] { EXPECT_EQ(zv_Start(handle), ZV_ERR_THREAD_CREATE); }),
              "Zarvo SDK: Start Error! Error Code = 12.\n");
    EXPECT_EQ(faults.threads, 0);
    EXPECT_EQ(kept().config[0].scale, SCALE_ZV_NO_ENCODE);
    EXPECT_EQ(count(issued(), "ENC_IOC_STOP"), 1u);
  }
  enable(1);
  EXPECT_EQ(zv_Start(handle), ZV_OK);
}

TEST_F(Capture, AudioBlocksOfTheMaskOnly) {
  Bytes blocks;
  for (u8 n = 0; n < 4; ++n) blocks.insert(blocks.end(), 48, n);
  EXPECT_EQ(zv_EnableAudioChannels(handle, 0x5), ZV_OK);
  for (const long result : {0, 192}) card::queue_audio({blocks, result});  // 0: no data yet, tried again
  EXPECT_THAT(capture({"a 2 96 48 0"}), ElementsAre("a 0 0 48 0", "a 2 96 48 0"));
  EXPECT_EQ(data_of("a 2 96 48 0"), Bytes(48, 2));
  EXPECT_GE(count(operations(), "read audio 0x4"), 2u);
  EXPECT_EQ(kept().audio_mask, 0u);
}

/// Catches: lengths, results and channels just beyond a limit that are delivered, or at it that are not.
TEST_F(Capture, LimitsOfEveryField) {
  enable(1 << 3);
  for (const u32 length : {0xFFFC1u, 0xFFFFFu, 0u, 0xFFFC0u})
    for (const long result : {0L, LONG_MIN, 1L}) card::queue_mpeg4({mpeg4(kIntra | length, {}).area, result});
  const Bytes scan = {1, 2, 3, 0xFF, 0xD9};
  const long huge = kReadsAreWatched ? 0x100001 : LONG_MAX;
  for (const long result : {16L, 19L, 0xFFC01L, huge, -7L, 0xFFC00L})
    card::queue_mjpeg(mjpeg(1, scan, result));
  for (const u32 channel : {16u, 0xFFFFFFFFu, 15u}) card::queue_mjpeg(mjpeg(channel, scan, 21));
  card::queue_mjpeg(mjpeg(1, {0xD9}, 17));
  EXPECT_THAT(capture({"m 3 44 1048532 0", "j 1 447 594 0"}),
              UnorderedElementsAre("m 3 44 20 0", "m 3 44 1048532 0", "j 1 447 598 0", "j 15 447 598 0",
                                   "j 1 447 594 0"));
}

/// Catches: whatever bytes make the SDK deliver from outside an area.
TEST_F(Capture, AnyBytes) {
  enable(0xFFFF);
  std::mt19937 random(20240229);
  for (int i = 0; i < 400; ++i) {
    Bytes area(64 + random() % 64);
    for (u8 &byte : area) byte = static_cast<u8>(random());
    if (i % 2 == 0) area[1] = area[2] = area[3] = 0;  // half of them with a sound channel
    const long result = std::array{1, 17, 64, 0xFFC00, 0x100000, -1}[random() % 6];
    card::queue_mpeg4({area, result});
    card::queue_mjpeg({area, result});
  }
  card::queue_mpeg4(mpeg4(kPredicted | 7, Bytes(7)));
  card::queue_mjpeg(mjpeg(3, {0xD9}, 17));
  EXPECT_GT(capture({"m 3 64 7 0", "j 3 447 594 0"}).size(), 20u);
}

/// Catches: a callback after zv_Stop(), when files are closed; a frame delivered once the stop has begun.
TEST_F(Capture, NothingArrivesAfterStop) {
  std::atomic<bool> held{false};
  on_delivery = [&](const std::string &got) {
    if (got[0] != 'm' || held.exchange(true)) return;
    EXPECT_TRUE(eventually([] { return zarvo::start_flag == 0; }));
  };
  for (int round = 0; round < 3; ++round) {
    held = false;
    start_endless();
    EXPECT_TRUE(eventually([&] { return held.load(); }));
    EXPECT_EQ(zv_Stop(handle), ZV_OK);
    EXPECT_EQ(faults.threads, 0);
    Lines got = delivered();
    std::erase_if(got, [](const std::string &line) { return line[0] == 'a'; });
    EXPECT_EQ(got.back(), "m 3 64 500 0");
  }
}

/// Catches: a stop inside a callback that waits for itself; a start that lets the old thread in it run on.
TEST_F(Capture, StopFromACallbackEndsCaptureAndItStartsAgain) {
  std::atomic<char> stopper{0};
  std::atomic<int> status{-1};
  on_delivery = [&](const std::string &got) {
    char stream = got[0];
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
  wait_for_ten_more();
  EXPECT_EQ(zv_Stop(handle), ZV_OK);  // while what the callbacks look at is still there
}

/// Catches: a close that waits for threads it has not told to end, or takes the card from under them.
TEST_F(Capture, CloseWhileCapturingLeavesNothing) {
  for (int round = 0; round < 3; ++round) {
    start_endless();
    EXPECT_EQ(zv_EnableWatchDog(handle), ZV_OK);
    wait_for_ten_more();
    close_leaving_nothing();
    open_card();
  }
}

/// Catches: control calls, callbacks or preview reads that race with a running capture.
TEST_F(Capture, ControlWhileCapturing) {
  start_endless();
  const auto watch = [&] {
    u8 *picture = nullptr;
    for (int i = 0; i < 20; ++i) zv_GetPreviewScreen(handle, &picture);
  };
  std::thread viewer(watch), second_viewer(watch);
  for (u32 i = 0; i < 50; ++i) {
    zv_RegisterCallBack(handle, i % 2 == 0 ? nullptr : callback<'m'>, nullptr, callback<'a'>);
    zv_EnableAudioChannels(handle, i % 16);
    zv_SetVideoStandard(handle, i % 2);
    zv_GetMotionStatus(handle);
  }
  viewer.join();
  second_viewer.join();
  wait_for_ten_more();
}

}  // namespace
