#include <gtest/gtest.h>

#include <cstdlib>
#include <ctime>

#include "picture/camera.h"
#include "picture_bench.h"

namespace virtual_card {
namespace {

constexpr u32 kCif = 2, kD1 = 9;
constexpr u32 kBarX = 18, kBarY = 5;  ///< hundredths: the yellow bar

// What is left of an object where it was two fields ago: a picture must not tell its past.
TEST(Cameras, PictureIsAFunctionOfTheMoment) {
  Camera walked(3), jumped(3);
  CardState state;
  walked.adjust(state);
  jumped.adjust(state);
  const auto moment = [](std::int64_t field) {
    return Field{0, field, std::chrono::microseconds(field * 16683)};
  };
  for (std::int64_t field = 0; field < 200; ++field) walked.draw(moment(field));
  jumped.draw(moment(198));
  jumped.draw(moment(199));
  EXPECT_EQ(walked.picture().y, jumped.picture().y);
  EXPECT_EQ(walked.picture().cb, jumped.picture().cb);
}

TEST(Cameras, ClockShowsLocalTimeOfTheFrame) {
  setenv("TZ", "XXX-5:30", 1);
  tzset();
  const std::chrono::microseconds time{(23 * 3600 + 59 * 60 + 58) * 1'000'000LL + 999'000};
  EXPECT_EQ(ClockText({1, 0, time}).view(), "05:29:58.24");
  EXPECT_EQ(ClockText({0, 1, time + std::chrono::microseconds(16683)}).view(), "05:29:58.29");
}

struct Property {
  const char *name;
  PictureSettings settings;
  Colour yellow;  ///< what becomes of the yellow bar (162, 44, 142)
};

class EveryProperty : public testing::TestWithParam<Property> {};

// A property that works the wrong way round, touches another channel, or the blue of a lost camera.
TEST_P(EveryProperty, IsSeenInItsChannelOnly) {
  PictureBench bench;
  for (const unsigned channel : {8u, 9u, 10u}) bench.encode(channel, kD1, 0);
  for (const unsigned channel : {9u, 10u}) bench.state.channel[channel].picture = GetParam().settings;
  bench.state.channel[10].lost = true;
  bench.window(9, {0, 0, 720, 480});
  bench.window(10, {480, 320, 720, 480});
  const Decoded changed = bench.look(9), neighbour = bench.look(8), lost = bench.look(10);
  EXPECT_TRUE(near(changed.at(kBarX, kBarY), GetParam().yellow));
  EXPECT_TRUE(near(neighbour.at(kBarX, kBarY), {162, 44, 142}));
  EXPECT_TRUE(near(lost.at(kBarX, kBarY), kLostBlue));
  bench.compose();
  EXPECT_TRUE(near(bench.pixel(720 * kBarX / 100, 480 * kBarY / 100), GetParam().yellow, 4));
  EXPECT_TRUE(near(bench.pixel(600, 400), kLostBlue, 2));
}

INSTANTIATE_TEST_SUITE_P(Properties, EveryProperty,
                         testing::Values(Property{"HuePlus90", {192, 128, 128, 128}, {162, 114, 44}},
                                         Property{"HueMinus180", {0, 128, 128, 128}, {162, 212, 114}},
                                         Property{"HalfSaturation", {128, 64, 128, 128}, {162, 86, 135}},
                                         Property{"HalfContrast", {128, 128, 64, 128}, {144, 44, 142}},
                                         Property{"Brighter", {128, 128, 128, 255}, {216, 44, 142}}),
                         [](const auto &test) { return test.param.name; });

// A mask that what moves paints over, that is off at one scale, or lies in the wrong place.
TEST(Masks, BlankTheirRectangleInEveryPicture) {
  for (const u32 scale : {1u, kCif, kD1}) {
    PictureBench bench;
    bench.encode(1, scale, scale == kD1 ? 0 : 1);
    bench.state.channel[1].mask = {1, 144, 432, 120, 464};
    bench.window(1, {0, 0, 360, 240});
    for (int i = 0; i < 10; ++i) {
      bench.fields(6);
      const Decoded picture = bench.look(1);
      bench.compose();
      for (const u32 x : {22u, 40u, 58u}) {
        for (const u32 y : {28u, 60u, 90u, 94u}) {
          ASSERT_TRUE(near(picture.at(x, y), kMaskGrey)) << "scale " << scale << " at " << x << ", " << y;
          ASSERT_TRUE(near(bench.pixel(360 * x / 100, 240 * y / 100), kMaskGrey, 1));
        }
      }
      for (const auto &[x, y] : {std::pair(18u, 94u), std::pair(40u, 22u), std::pair(62u, 94u)})
        ASSERT_FALSE(near(picture.at(x, y), kMaskGrey));
    }
    bench.state.channel[1].mask = {};
    EXPECT_FALSE(near(bench.look(1).at(22, 28), kMaskGrey));
  }
}

}  // namespace
}  // namespace virtual_card
