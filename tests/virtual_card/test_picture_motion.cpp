// Motion detection and its marks.

#include "picture/motion_detector.h"
#include "picture_test.h"

namespace {

constexpr unsigned kChannel = 5;
constexpr u32 kBit = 1u << kChannel;
constexpr int kLook = 6;  ///< fields from one look of the detector to the next

class MotionTest : public PictureTest {
 protected:
  MotionTest() { state.motion_enable = 0xFFFF; }
  u32 motion_after(int count) {
    fields(count);
    return engine.motion();
  }
  bool moves(int looks) { return (motion_after(looks * kLook) & kBit) != 0; }
  void set_area(u32 column, u32 row, u32 columns, u32 rows, u16 level) {
    const std::vector<u16> levels(std::size_t{columns} * rows, level);
    engine.set_thresholds({kChannel, column, row, columns, rows, levels.data()});
  }
};

TEST_F(MotionTest, MovingCamerasAreReportedAndNoOthers) {
  state.channel[0].scene = card::Scene::still;
  state.channel[1].scene = card::Scene::black;
  state.channel[2].lost = true;
  state.motion_enable = 0xFFFF & ~8u;
  ASSERT_EQ(motion_after(2 * kLook) & 0xF, 0u);
  for (int look = 0; look < 16; ++look) ASSERT_EQ(motion_after(kLook), 0xFFF0u);
  state.channel[0].picture.brightness = 255;
  EXPECT_EQ(motion_after(3 * kLook) & 1, 0u) << "a change of the picture's properties";
}

// Catches: levels that work the wrong way round, and areas beside the place they were set for.
TEST_F(MotionTest, LevelsAreasAndMasksDecideBlockByBlock) {
  state.motion_enable = kBit;
  EXPECT_TRUE(moves(3));
  engine.set_threshold(kChannel, 250);
  EXPECT_FALSE(moves(5));
  engine.set_threshold(kChannel, 0);
  EXPECT_TRUE(moves(3));
  engine.set_threshold(kChannel, 0xFFFF);
  EXPECT_FALSE(moves(5));
  set_area(0, 0, 45, 4, 0);  // the bars: nothing ever moves there
  EXPECT_FALSE(moves(20));
  set_area(41, 28, 1, 1, 0);  // one block of the frame number's last figures
  EXPECT_TRUE(moves(3));
  set_area(40, 28, 24, 36, 0);  // to the end of the map, beyond the picture
  EXPECT_TRUE(moves(3));
  state.channel[kChannel].mask = {kChannel, 0, 720, 440, 480};
  EXPECT_FALSE(moves(5));
}

// Catches: a report that flickers between looks, never ends, or survives a restart.
TEST_F(MotionTest, ReportIsHeldThenEndsAndStartsAfresh) {
  state.motion_enable = kBit;
  motion_after(5 * kLook);
  for (int field = 0; field < 3 * kLook; ++field) ASSERT_EQ(motion_after(1), kBit);
  engine.set_threshold(kChannel, 0xFFFF);
  int held = 0;
  while (held < 100 && motion_after(1) != 0) ++held;
  EXPECT_GE(held, 2 * kLook - 1);
  EXPECT_LE(held, 3 * kLook);
  engine.set_threshold(kChannel, card::kDefaultMotionLevel);
  motion_after(5 * kLook);
  state.motion_enable = 0;
  EXPECT_EQ(motion_after(1), 0u);
  state.motion_enable = kBit;
  while (!card::MotionDetector::looks_at(next)) fields(1);
  EXPECT_EQ(motion_after(1), 0u) << "one look compares with nothing";
}

// Catches: marks on the wrong block.
TEST_F(MotionTest, MarksFrameTheMovingBlocksOfThePreview) {
  window(kChannel, {0, 0, 720, 480});
  engine.set_threshold(kChannel, 0xFFFF);
  set_area(38, 28, 6, 2, 0);  // the frame number's last figures
  const auto red = [&](Area area) {
    compose();
    int count = 0;
    for (u32 y = area.y_start; y < area.y_end; ++y)
      for (u32 x = area.x_start; x < area.x_end; ++x) count += near(pixel(x, y), {106, 100, 212}, 0);
    return count;
  };
  state.display.motion_trace = true;
  fields(3 * kLook);
  const int in_area = red({38 * 16, 28 * 16, 44 * 16, 30 * 16});
  EXPECT_GT(in_area, 50);
  EXPECT_EQ(red({0, 64, 720, 480}), in_area);
}

}  // namespace
