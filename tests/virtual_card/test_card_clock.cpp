// Card time: the three clocks, and the watchdog.

#include "node_test.h"

namespace {

// Catches: another number of frames when time is advanced in pieces, a change of the standard that moves
// the fields.
TEST_F(NodeTest, FramesAndBlocksComeAtTheirTimes) {
  encode(3);
  start();
  EXPECT_EQ(read_mpeg4(), 0);
  card::advance(1001ms);
  EXPECT_EQ(card::counters().mpeg4.made, 30u);
  EXPECT_EQ(card::counters().audio.made, 63u);  // at 0, 16, ... 992 ms
  for (int piece = 0; piece < 1001; ++piece) card::advance(1ms);
  EXPECT_EQ(card::counters().mpeg4.made, 60u);
  EXPECT_EQ(card::counters().audio.made, 126u);
  card::advance_frames(15);
  EXPECT_EQ(card::counters().mjpeg.made, 75u);

  EXPECT_EQ(send(display, driver::DISP_IOC_SET_STANDARD, u32{VIDEO_STANDARD_ZV_PAL}), 0);
  card::advance(2s);
  EXPECT_EQ(card::counters().mpeg4.made, 75u + 50u);
  EXPECT_EQ(card::counters().mpeg4.lost, 0u);
}

TEST_F(NodeTest, TheWatchdogCountsDownUnlessFed) {
  card::script_board_replies(driver::kBoardWatchdogOn, {0});
  EXPECT_EQ(board_command(driver::kBoardWatchdogOn), 0u);
  EXPECT_FALSE(card::counters().watchdog_running) << "a command that is not confirmed is carried out";
  for (int feed = 0; feed < 3; ++feed) {
    EXPECT_EQ(board_command(driver::kBoardWatchdogOn), driver::kBoardWatchdogOnReply);
    card::advance(59s);
  }
  EXPECT_TRUE(card::counters().watchdog_running);

  testing::internal::CaptureStderr();
  for (int minute = 0; minute < 2; ++minute) card::advance(60s);
  EXPECT_EQ(testing::internal::GetCapturedStderr(),
            "virtual card: the watchdog would have reset the machine\n");
  EXPECT_EQ(card::counters().watchdog_resets, 1u);
  EXPECT_FALSE(card::counters().watchdog_running);

  EXPECT_EQ(board_command(driver::kBoardWatchdogOn), driver::kBoardWatchdogOnReply);
  EXPECT_EQ(board_command(driver::kBoardWatchdogOff), driver::kBoardWatchdogOffReply);
  card::advance(120s);
  EXPECT_EQ(card::counters().watchdog_resets, 1u);
}

TEST_F(NodeTest, FramesComeByThemselvesUntilTheLastClose) {
  for (const auto mode : {card::ClockMode::real_time, card::ClockMode::fast}) {
    run_with(mode, 4);
    encode(0);
    const auto made = card::counters().mpeg4.made;
    start();
    EXPECT_TRUE(eventually([&] { return card::counters().mpeg4.made >= made + 10; }));
    close_nodes();
    const auto at_close = card::counters().mpeg4.made;
    open_nodes();
    EXPECT_FALSE(card::counters().mpeg4.made > at_close) << "encodes before it is started";
  }
}

// Catches: a frame that was being encoded when the stop came. It would open the next recording, with no
// intra frame before it.
TEST_F(NodeTest, AStopInTheMiddleOfAFieldLeavesNothingBehind) {
  run_with(card::ClockMode::fast, 4);
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) encode(channel);
  for (int round = 0; round < 10; ++round) {
    const auto made = card::counters().mpeg4.made;
    start();
    EXPECT_TRUE(eventually([&] { return card::counters().mpeg4.made > made; }));
    stop();
    close_nodes();  // returns when the field is finished
    open_nodes();
    EXPECT_EQ(read_mpeg4() + read_mjpeg() + read_audio(), 0);
  }
}

// Catches: a card that cannot keep up and falls further and further behind, losses that are not counted in
// one of the streams.
TEST_F(NodeTest, WhatComesTooLateIsLostAndCounted) {
  run_with(card::ClockMode::fast, 1000);
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) encode(channel);
  start();
  EXPECT_TRUE(eventually([&] {
    read_mpeg4();
    read_mjpeg();
    return card::counters().mpeg4.lost > 10000;
  }));
  close_nodes();
  const card::Counters counters = card::counters();
  EXPECT_EQ(counters.mjpeg.made, counters.mpeg4.made);
  const auto frames = static_cast<double>(counters.mpeg4.made) / ZV_CHANNELS;
  EXPECT_NEAR(static_cast<double>(counters.audio.made), frames * 1001 / 480, frames / 20);  // 16 ms each
}

}  // namespace
