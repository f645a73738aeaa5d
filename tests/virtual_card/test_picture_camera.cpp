// What a camera shows: picture properties, clock, privacy mask.

#include <algorithm>
#include <cstdlib>
#include <ctime>

#include "picture/camera.h"
#include "picture/encoded_picture.h"
#include "picture_test.h"

namespace {

constexpr u32 kBarX = 18, kBarY = 5;  ///< hundredths: the yellow bar

// Catches: what is left of an object where it was two fields ago.
TEST_F(PictureTest, PictureIsAFunctionOfTheMoment) {
  card::Camera walked(3), jumped(3);
  walked.adjust(state);
  jumped.adjust(state);
  const auto moment = [](std::int64_t field) {
    return card::Field{0, field, std::chrono::microseconds(field * 16683)};
  };
  for (std::int64_t field = 0; field < 200; ++field) walked.draw(moment(field));
  jumped.draw(moment(198));
  jumped.draw(moment(199));
  EXPECT_EQ(walked.picture().y, jumped.picture().y);
  EXPECT_EQ(walked.picture().cb, jumped.picture().cb);
}

TEST_F(PictureTest, FiguresShowChannelAndLocalTimeOfTheFrame) {
  EXPECT_EQ(card::channel_text(0), "01");
  setenv("TZ", "XXX-5:30", 1);
  tzset();
  const std::chrono::microseconds time{(23 * 3600 + 59 * 60 + 58) * 1'000'000LL + 999'000};
  EXPECT_EQ(card::ClockText({1, 0, time}).view(), "05:29:58.24");
  EXPECT_EQ(card::ClockText({0, 1, time + std::chrono::microseconds(16683)}).view(), "05:29:58.29");
}

// Catches: the colours of one field in the other.
TEST_F(PictureTest, AFieldKeepsItsOwnColours) {
  card::Picture fields;
  fields.resize(720, 480);
  card::fill(fields, {0, 0, 720, 480}, card::kMaskGrey);
  card::fill(fields, {0, 0, 720, 480}, card::kLostBlue, card::field_lines(1));
  card::EncodedPicture encoded;
  card::scale_picture(fields, 1, {352, 240, false}, encoded);
  EXPECT_THAT(encoded.cb, testing::Each(card::kLostBlue.cb));
  EXPECT_THAT(encoded.cr, testing::Each(card::kLostBlue.cr));
}

// Catches: a property that works the wrong way round, touches another channel, or the blue of a lost camera.
TEST_F(PictureTest, APropertyIsSeenInItsChannelOnly) {
  const struct {
    card::PictureSettings settings;
    Colour yellow;                                       // what becomes of the yellow bar (162, 44, 142)
  } cases[] = {{{192, 128, 128, 128}, {162, 114, 44}},   // hue + 90
               {{0, 128, 128, 128}, {162, 212, 114}},    // hue - 180
               {{128, 64, 128, 128}, {162, 86, 135}},    // half the saturation
               {{128, 128, 64, 128}, {144, 44, 142}},    // half the contrast
               {{128, 128, 128, 255}, {216, 44, 142}}};  // brighter
  for (const unsigned channel : {8u, 9u, 10u}) encode(channel, kD1, 0);
  state.channel[10].lost = true;
  window(9, {0, 0, 720, 480});
  window(10, {480, 320, 720, 480});
  for (const auto &[settings, yellow] : cases) {
    SCOPED_TRACE(testing::PrintToString(int{yellow.cb}));
    for (const unsigned channel : {9u, 10u}) state.channel[channel].picture = settings;
    EXPECT_TRUE(near(look(9).at(kBarX, kBarY), yellow));
    EXPECT_TRUE(near(look(8).at(kBarX, kBarY), {162, 44, 142})) << "the neighbour";
    EXPECT_TRUE(near(look(10).at(kBarX, kBarY), card::kLostBlue));
    compose();
    EXPECT_TRUE(near(pixel(720 * kBarX / 100, 480 * kBarY / 100), yellow, 4));
    EXPECT_TRUE(near(pixel(600, 400), card::kLostBlue, 2));
  }
}

// Catches: a burnt-in number that keeps its height when the size of the picture changes, or stays when it is
// off.
TEST_F(PictureTest, TheNumberFitsItsPicture) {
  state.channel[2].scene = card::Scene::black;
  const auto bright_lines = [&](u32 scale, bool shown) {
    encode(2, scale, 0);
    state.channel[2].encoder.number_overlay = shown;
    const Frame frame = look(2);
    int lines = 0;
    for (u32 y = 0; y < frame.height / 2; ++y) {
      const u8 *const line = frame.samples.data() + std::size_t{y} * frame.width;
      lines += std::any_of(line, line + frame.width / 2, [](u8 luma) { return luma > 150; });
    }
    return lines;
  };
  const int cif = bright_lines(kCif, true);
  EXPECT_GT(cif, 8);
  EXPECT_NEAR(bright_lines(kD1, true), 2 * cif, 2);
  EXPECT_EQ(bright_lines(kCif, true), cif);
  EXPECT_EQ(bright_lines(kCif, false), 0);
}

// Catches: a mask that what moves paints over, that is off at one scale, or lies in the wrong place.
TEST_F(PictureTest, MasksBlankTheirRectangleInEveryPicture) {
  for (const u32 scale : {kHalfD1, kCif, kD1}) {
    power_up();
    encode(1, scale, scale == kD1 ? 0 : 1);
    state.channel[1].mask = {1, 144, 432, 120, 464};
    window(1, {0, 0, 360, 240});
    for (int i = 0; i < 10; ++i) {
      fields(6);
      const Frame picture = look(1);
      compose();
      for (const u32 x : {22u, 40u, 58u})
        for (const u32 y : {28u, 60u, 90u, 94u})
          ASSERT_TRUE(near(picture.at(x, y), card::kMaskGrey) &&
                      near(pixel(360 * x / 100, 240 * y / 100), card::kMaskGrey, 1))
              << "scale " << scale << " at " << x << ", " << y;
      for (const auto &[x, y] : {std::pair(18u, 94u), std::pair(40u, 22u), std::pair(62u, 94u)})
        ASSERT_FALSE(near(picture.at(x, y), card::kMaskGrey));
    }
    state.channel[1].mask = {};
    EXPECT_FALSE(near(look(1).at(22, 28), card::kMaskGrey));
  }
}

}  // namespace
