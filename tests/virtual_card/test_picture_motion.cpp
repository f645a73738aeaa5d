#include <gtest/gtest.h>

#include "picture/motion_detector.h"
#include "picture_bench.h"

namespace virtual_card {
namespace {

constexpr unsigned kChannel = 5;
constexpr u32 kBit = 1u << kChannel;
constexpr int kLook = 6;  ///< fields from one look of the detector to the next

class Motion : public testing::Test {
 protected:
  Motion() { bench_.state.motion_enable = 0xFFFF; }
  u32 motion_after(int fields) {
    bench_.fields(fields);
    return bench_.engine.motion();
  }
  bool moves(int fields) { return (motion_after(fields) & kBit) != 0; }
  void set_area(u32 column, u32 row, u32 columns, u32 rows, u16 level) {
    const std::vector<u16> levels(std::size_t{columns} * rows, level);
    bench_.engine.set_thresholds({kChannel, column, row, columns, rows, levels.data()});
  }
  PictureBench bench_;
};

TEST_F(Motion, MovingCamerasAreReportedAndNoOthers) {
  bench_.state.channel[0].scene = Scene::still;
  bench_.state.channel[1].scene = Scene::black;
  bench_.state.channel[2].lost = true;
  bench_.state.motion_enable = 0xFFFF & ~8u;
  ASSERT_EQ(motion_after(2 * kLook) & 0xF, 0u);
  for (int look = 0; look < 16; ++look) ASSERT_EQ(motion_after(kLook), 0xFFF0u);
}

// Levels that work the wrong way round, and areas beside the place they were set for.
TEST_F(Motion, LevelsAreasAndMasksDecideBlockByBlock) {
  bench_.state.motion_enable = kBit;
  EXPECT_TRUE(moves(3 * kLook));
  bench_.engine.set_threshold(kChannel, 250);
  EXPECT_FALSE(moves(5 * kLook));
  bench_.engine.set_threshold(kChannel, 0);
  EXPECT_TRUE(moves(3 * kLook));
  bench_.engine.set_threshold(kChannel, 0xFFFF);
  EXPECT_FALSE(moves(5 * kLook));
  set_area(0, 0, 45, 4, 0);  // the bars: nothing ever moves there
  EXPECT_FALSE(moves(20 * kLook));
  set_area(41, 28, 1, 1, 0);  // one block of the frame number's last figures
  EXPECT_TRUE(moves(3 * kLook));
  set_area(40, 28, 24, 36, 0);  // to the end of the map, beyond the picture
  EXPECT_TRUE(moves(3 * kLook));
  bench_.state.channel[kChannel].mask = {kChannel, 0, 720, 440, 480};
  EXPECT_FALSE(moves(5 * kLook));
}

// A report that flickers between looks, never ends, or survives a restart.
TEST_F(Motion, ReportIsHeldThenEndsAndStartsAfresh) {
  bench_.state.motion_enable = kBit;
  motion_after(5 * kLook);
  for (int field = 0; field < 3 * kLook; ++field) ASSERT_TRUE(moves(1));
  bench_.engine.set_threshold(kChannel, 0xFFFF);
  int held = 0;
  while (held < 100 && moves(1)) ++held;
  EXPECT_GE(held, 2 * kLook - 1);
  EXPECT_LE(held, 3 * kLook);
  bench_.engine.set_threshold(kChannel, kDefaultMotionLevel);
  motion_after(5 * kLook);
  bench_.state.motion_enable = 0;
  EXPECT_EQ(motion_after(1), 0u);
  bench_.state.motion_enable = kBit;
  while (!MotionDetector::looks_at(bench_.next)) bench_.fields(1);
  EXPECT_EQ(motion_after(1), 0u) << "one look compares with nothing";
}

// Marks on the wrong block, or shown while the trace is off.
TEST_F(Motion, MarksFrameTheMovingBlocksOfThePreview) {
  bench_.window(kChannel, {0, 0, 720, 480});
  bench_.engine.set_threshold(kChannel, 0xFFFF);
  set_area(38, 28, 6, 2, 0);  // the frame number's last figures
  const auto red = [&](Area area) {
    bench_.compose();
    int count = 0;
    for (u32 y = area.y_start; y < area.y_end; ++y) {
      for (u32 x = area.x_start; x < area.x_end; ++x) count += near(bench_.pixel(x, y), {106, 100, 212}, 0);
    }
    return count;
  };
  bench_.fields(3 * kLook);
  EXPECT_EQ(red({0, 0, 720, 480}), 0);
  bench_.state.display.motion_trace = true;
  const int in_area = red({38 * 16, 28 * 16, 44 * 16, 30 * 16});
  EXPECT_GT(in_area, 50);
  EXPECT_EQ(red({0, 64, 720, 480}), in_area);
}

}  // namespace
}  // namespace virtual_card
