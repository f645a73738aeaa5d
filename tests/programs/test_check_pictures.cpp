// What zarvo_check measures in pictures, and what it says of series of them.
#include <cmath>
#include <deque>

#include "check_test.h"
#include "programs/check/preview_picture.h"
#include "programs/check/series.h"

namespace contract {
namespace {

std::deque<Image> shown;  // the next pictures of the preview

Image plain(u32 width, u32 height, u8 y) {
  const std::vector<u8> luma(std::size_t{width} * height, y), chroma(luma.size() / 4, 128);
  return {width, height, height / 2, luma, chroma, chroma};
}
void paint(Image &image, Area area, u8 y) {
  for (u32 line = area.y_start; line < std::min(area.y_end, image.height); ++line)
    std::fill_n(image.y.begin() + line * image.width + area.x_start,
                std::min(area.x_end, image.width) - area.x_start, y);
}
/// A picture of tiles that repeat every `period` pixels across.
Image tiles(u32 width, u32 height, u32 period = 9999, u32 seed = 0) {
  Image image = plain(width, height, 0);
  for (u32 y = 0; y < height; y += 10)
    for (u32 x = 0; x < width; x += 10) {
      const u32 tile = (x % period / 20 * 73856093u ^ y / 20 * 19349663u ^ seed * 83492791u) * 2654435761u;
      paint(image, {x, y, x + 10, y + 10}, static_cast<u8>(50 + (tile >> 24) * 6 / 10));
    }
  return image;
}

TEST(CheckImage, MeasuresTheAreaThatIsAsked) {
  std::vector<u8> uyvy;
  for (u8 n = 0; n < 16; ++n)
    uyvy.insert(uyvy.end(), {n, static_cast<u8>(100 + n), static_cast<u8>(50 + n), 200});
  const Image image = unpacked(uyvy.data(), 8, 4);  // four pairs a line
  const Tones right = tones(image, {4, 1, 8, 3});   // pairs 6, 7, 10 and 11
  EXPECT_DOUBLE_EQ(right.luma, (108.5 + 200) / 2);
  EXPECT_DOUBLE_EQ(right.cb, 8.5);
  EXPECT_DOUBLE_EQ(right.cr, 58.5);
  EXPECT_NEAR(right.deviation, 45.8, 0.1);
  Image other = image;
  other.y[6] -= 10;
  other.y[7] -= 11;
  EXPECT_EQ(changed_pixels(image, other, 10), 1u);
  const Image left = tiles(100, 60, 50);
  EXPECT_EQ(difference(left, {0, 0, 50, 60}, left, {50, 0, 100, 60}), 0);
  Image tinted = left;
  for (u8 &sample : tinted.cr) sample += 30;
  EXPECT_NEAR(difference(left, left.all(), tinted, tinted.all()), 10, 1e-9);
}

// Catches: memory behind a picture that is smaller than the card should deliver.
TEST(CheckImage, RefusesToMeasureOutside) {
  const Image image = tiles(352, 240);
  EXPECT_THROW(tones(image, {0, 0, 353, 240}), std::runtime_error);
  EXPECT_THROW(tones(image, {0, 0, 352, 241}), std::runtime_error);
  EXPECT_THROW(tones({}, {0, 0, 0, 0}), std::runtime_error);
  EXPECT_THROW(changed_pixels(image, tiles(352, 120), 9), std::runtime_error);
}

/// The camera's picture with settings: 1 is neutral for contrast and colour.
Image shot(int brightness = 0, double contrast = 1, double colour = 1, double hue = 0) {
  Image image = tiles(352, 240);
  for (u8 &y : image.y) y = static_cast<u8>(std::lround(128 + brightness + (y - 128) * contrast));
  std::ranges::fill(image.cb, static_cast<u8>(std::lround(128 + 20 * colour * std::cos(hue))));
  std::ranges::fill(image.cr, static_cast<u8>(std::lround(128 + 20 * colour * std::sin(hue))));
  return image;
}
Image with(Image image, Area area, u8 y = 16) {
  paint(image, area, y);
  return image;
}
constexpr Area kMask{120, 80, 240, 160}, kMaskTop{120, 80, 240, 150}, kFirst{0, 0, 120, 80},
    kLast{240, 160, 352, 240};
constexpr Area kNumber{20, 20, 36, 32}, k30Pixels{0, 0, 6, 5}, k32Pixels{0, 0, 8, 4},
    kThing{100, 0, 200, 200};

PictureSeries good_pictures() {
  PictureSeries s;
  s.neutral = s.still = s.back = s.unmasked = s.unnumbered = s.other_before = s.other_during = shot();
  s.bright = shot(20);
  s.dark = shot(-20);
  s.strong = shot(0, 1.5);
  s.weak = shot(0, 0.4);
  s.colourful = shot(0, 1, 1.8);
  s.grey = shot(0, 1, 0);
  s.hue = shot(0, 1, 1, 1.57);
  s.masked = with(s.neutral, kMask);
  s.numbered = with(s.neutral, kNumber, 250);
  return s;
}

TEST(CheckSeries, PicturesFollowTheSettings) {
  using S = PictureSeries;
  PreparedBench bench;
  const auto present = [](const S &series) {
    Checks checks;
    add_picture_series(checks, [&series](Bench &) { return series; });
    return checks;
  };
  expect_rows<S>(
      good_pictures(), bench, present,
      {
          {"picture.brightness.up", kHeld, [](S &s) { s.bright = shot(10); }},
          {"picture.brightness.up", kBroken, [](S &s) { s.bright = shot(7); }},
          {"picture.brightness.down", kBroken, [](S &s) { s.dark = s.neutral; }},
          {"picture.contrast.up", kBroken, [](S &s) { s.strong = s.bright; }},
          {"picture.contrast.down", kBroken, [](S &s) { s.weak = s.strong; }},
          {"picture.saturation.up", kBroken, [](S &s) { s.colourful = s.grey; }},
          {"picture.saturation.down", kBroken, [](S &s) { s.grey = shot(0, 1, 0.5); }},
          {"picture.hue", kBroken, [](S &s) { s.hue = s.neutral; }},
          {"picture.hue", kBroken, [](S &s) { s.hue = shot(9, 1, 1, 1.57); }},
          {"picture.back", kHeld, [](S &s) { s.still = s.back = shot(9, 1, 1, 1.57); }},
          {"picture.back", kBroken, [](S &s) { s.back = shot(0, 1, 1.8); }},
          {"picture.other-camera", kBroken, [](S &s) { s.other_during = s.strong; }},
          {"picture.mask.flat", kBroken, [](S &s) { s.masked = with(s.neutral, kMaskTop); }},
          {"picture.mask.only-there", kBroken, [](S &s) { s.masked = with(s.neutral, kFirst); }},
          {"picture.mask.only-there", kBroken, [](S &s) { s.masked = with(s.neutral, kLast); }},
          {"picture.mask.back", kBroken, [](S &s) { s.unmasked = s.masked; }},
          {"picture.mask.back", kSkipped, [](S &s) { s.back = with(s.neutral, kMask); }},
          {"picture.number.shows", kBroken, [](S &s) { s.numbered = s.neutral; }},
          {"picture.number.shows", kHeld, [](S &s) { s.numbered = with(s.neutral, k32Pixels, 250); }},
          {"picture.number.shows", kBroken, [](S &s) { s.numbered = with(s.neutral, k30Pixels, 250); }},
          {"picture.number.shows", kBroken, [](S &s) { s.back = s.numbered; }},  // something else moves there
          {"picture.number.hides", kBroken, [](S &s) { s.unnumbered = s.numbered; }},
          {"picture.number.hides", kHeld, [](S &s) { s.unnumbered = with(s.neutral, kThing); }},
          {"picture.number.hides", kSkipped, [](S &s) { s.numbered = s.neutral; }},
          {"picture.hue", kSkipped, [](S &s) { s.neutral = plain(352, 240, 90); }},
      });
}

TEST(CheckSeries, MotionTags) {
  const MotionSeries good{true, {12, 0}, {12, 7}, {12, 0}, {12, 0}, {12, 7}, {6, 0}, 11, 20};
  using S = MotionSeries;
  PreparedBench bench;
  const auto present = [](const S &series) {
    Checks checks;
    add_motion_series(checks, [&series](Bench &) { return series; });
    return checks;
  };
  expect_rows<S>(good, bench, present,
                 {
                     {"motion.threshold-0xffff", kBroken, [](S &s) { s.never.frames = 0; }},
                     {"motion.threshold-0", kBroken, [](S &s) { s.always.with_motion = 6; }},
                     {"motion.threshold-0", kSkipped, [](S &s) { s.moves = false; }},
                     {"motion.status", kBroken, [](S &s) { s.status_set = 10; }},
                     {"motion.status", kBroken, [](S &s) { s.always.with_motion = 6; }},
                     {"motion.excluded", kBroken, [](S &s) { s.excluded.with_motion = 1; }},
                     {"motion.included", kBroken, [](S &s) { s.included.with_motion = 6; }},
                     {"motion.stopped", kBroken, [](S &s) { s.stopped.with_motion = 1; }},
                     {"motion.other-camera", kBroken, [](S &s) { s.other.with_motion = 1; }},
                 });
}

TEST(CheckPreview, PicturesFollowTheLayout) {
  const Image one = tiles(720, 480), other = tiles(720, 480, 9999, 5), black = plain(720, 480, 16);
  const Area pip{440, 24, 680, 184}, window{360, 0, 720, 240};
  Image zoomed = one;  // the upper left quarter, magnified
  for (u32 y = 0; y < 480; ++y)
    for (u32 x = 0; x < 720; ++x) zoomed.y[y * 720 + x] = one.y[y / 2 * 720 + x / 2];
  const struct {
    const char *check;
    u32 cameras;
    std::vector<Image> pictures;
    Outcome outcome;
  } rows[] = {
      {"preview.layout.16", 0xFFFF, {one}, kHeld},
      {"preview.layout.16", 0xFFFF, {tiles(720, 480, 180)}, kBroken},  // four windows in a row are alike
      {"preview.layout.4", 0x5, {tiles(720, 480, 360)}, kHeld},        // only the left two windows count
      {"preview.focus", 0x21, {one, one, one}, kBroken},
      {"preview.focus", 0x21, {one, other, other}, kBroken},
      {"preview.window.disabled", 0xFFFF, {with(one, window)}, kHeld},
      {"preview.window.disabled", 0xFFFF, {with(one, window, 26)}, kBroken},
      {"preview.pip.shows", 0x21, {one, one, one}, kBroken},
      {"preview.pip.shows", 0x21, {one, black, one}, kBroken},
      {"preview.pip.ends", 0x21, {one, with(one, pip), with(one, pip)}, kBroken},
      {"preview.zoom", 0x1, {one, zoomed, one}, kHeld},
      {"preview.zoom", 0x1, {one, one, one}, kBroken},
      {"preview.zoom", 0x1, {one, zoomed, zoomed}, kBroken},
  };
  const Checks checks = all_checks();
  PreparedBench bench;
  for (std::size_t n = 0; n < std::size(rows); ++n) {
    bench.camera_mask = rows[n].cameras;
    shown.assign(rows[n].pictures.begin(), rows[n].pictures.end());
    expect_outcome(checks, rows[n].check, bench, rows[n].outcome, n);
    EXPECT_TRUE(shown.empty()) << "row " << n;
  }
}

}  // namespace

// Takes the place of the function that fetches pictures from the card.
Image settled_preview(HANDLE) {
  if (shown.empty()) throw std::logic_error("the test has no more pictures");
  Image image = shown.front();
  shown.pop_front();
  return image;
}

}  // namespace contract
