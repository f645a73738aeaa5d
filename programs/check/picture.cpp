// Theme picture: properties, masks and channel numbers change what they should in decoded pictures.
#include <algorithm>
#include <cmath>

#include "bench.h"
#include "check.h"
#include "lazy.h"
#include "programs/common/card.h"
#include "series.h"

namespace contract {
namespace {

constexpr ZV_VIDEO_PROPERTY kNeutral{0, 100, 100, 0};
constexpr ZV_RECT kMask{240, 160, 480, 320};
constexpr Area kMaskedCif{124, 84, 228, 156};  ///< inside the mask in a CIF picture: 704 pixels are 352

PictureSeries take_series(Bench &bench) {
  HANDLE card = bench.sdk(VIDEO_STANDARD_ZV_NTSC, RESOLUTION_ZV_720);
  PictureSeries series;
  const u32 cameras = bench.cameras();
  const u32 camera = first_channel(cameras);
  const u32 other = first_channel(cameras & ~(1u << camera));
  Live live(card, 1u << camera | 1u << other);
  const auto with = [&](ZV_VIDEO_PROPERTY property) {
    check(zv_SetVideoProperty(card, camera, &property), "zv_SetVideoProperty");
    return live.picture(camera);
  };
  const auto masked = [&](ZV_RECT rect) {
    check(zv_SetShieldRect(card, camera, &rect), "zv_SetShieldRect");
    return live.picture(camera);
  };
  masked({});
  zv_DisableVideoChannelNumber(card, camera);
  series.neutral = with(kNeutral);
  series.still = live.picture(camera);
  series.other_before = live.picture(other);
  series.bright = with({0, 100, 100, 25});
  series.dark = with({0, 100, 100, -25});
  series.strong = with({0, 100, 180, 0});
  series.other_during = live.picture(other);
  series.weak = with({0, 100, 20, 0});
  series.colourful = with({0, 180, 100, 0});
  series.grey = with({0, 0, 100, 0});
  series.hue = with({90, 100, 100, 0});
  series.back = with(kNeutral);
  series.masked = masked(kMask);
  series.unmasked = masked({});
  zv_EnableVideoChannelNumber(card, camera);
  series.numbered = live.picture(camera);
  zv_DisableVideoChannelNumber(card, camera);
  series.unnumbered = live.picture(camera);
  return series;
}

double colour(const Image &image) {
  double sum = 0;
  for (const auto *plane : {&image.cb, &image.cr})
    for (const u8 sample : *plane) sum += std::abs(sample - 128);
  return sum / static_cast<double>(image.cb.size() + image.cr.size());
}
double luma(const Image &image) {
  return tones(image, image.all()).luma;
}
double contrast(const Image &image) {
  return tones(image, image.all()).deviation;
}

/// Returns the pixels that are alike in all pictures without a number and differ clearly in the one with it.
/// Things that move are not alike in four pictures.
std::vector<std::size_t> number_pixels(const PictureSeries &series) {
  constexpr int kLike = 8, kClearly = 40;
  const Image *const plain[] = {&series.still, &series.back, &series.unmasked};
  for (const Image *image : plain) require_same_size(series.neutral, *image);
  require_same_size(series.neutral, series.numbered);
  std::vector<std::size_t> found;
  for (std::size_t at = 0; at < series.neutral.y.size(); ++at) {
    const int luma = series.neutral.y[at];
    if (std::abs(series.numbered.y[at] - luma) > kClearly &&
        std::ranges::all_of(plain, [&](const Image *image) { return std::abs(image->y[at] - luma) < kLike; }))
      found.push_back(at);
  }
  return found;
}

Result rises(const std::string &what, double from, double to, double least) {
  return expect(to - from > least, words(what, " above ", from + least), to);
}

Result hue(const PictureSeries &series) {
  const Tones before = tones(series.neutral, series.neutral.all()),
              after = tones(series.hue, series.hue.all());
  const double turned = difference(series.neutral, series.neutral.all(), series.hue, series.hue.all());
  return expect(turned > 4 && std::abs(before.luma - after.luma) < 8, "other colours, the same luma",
                "a difference of ", turned, ", luma from ", before.luma, " to ", after.luma);
}

Result back(const PictureSeries &series) {
  const double found = difference(series.neutral, series.neutral.all(), series.back, series.back.all());
  const double usual = difference(series.neutral, series.neutral.all(), series.still, series.still.all());
  return expect(found < usual + 3, words("a difference below ", usual + 3), found);
}

Result mask_flat(const PictureSeries &series) {
  const Tones found = tones(series.masked, kMaskedCif);
  return expect(found.deviation < 3, "a flat area", "a deviation of ", found.deviation);
}

Result mask_only_there(const PictureSeries &series) {
  for (const Area outside :
       {Area{0, 0, 100, 70}, Area{252, 0, 352, 70}, Area{0, 170, 100, 240}, Area{252, 170, 352, 240}}) {
    const double found = difference(series.back, outside, series.masked, outside);
    if (found > 20) return broken("the corners as before", words("a difference of ", found));
  }
  return held();
}

Result mask_back(const PictureSeries &series) {
  const Tones found = tones(series.unmasked, kMaskedCif);
  const Tones before = tones(series.back, kMaskedCif);
  if (before.deviation < 4) return skipped("the middle of the picture has no details");
  return expect(found.deviation > before.deviation / 2, "details in the area again", "a deviation of ",
                found.deviation);
}

Result number_shows(const PictureSeries &series) {
  const std::size_t found = number_pixels(series).size();
  return expect(found > 30, "a number", found, " new pixels");
}

Result number_hides(const PictureSeries &series) {
  const std::vector<std::size_t> number = number_pixels(series);
  require_same_size(series.numbered, series.unnumbered);
  if (number.empty()) return skipped("no number has appeared");
  const auto left = std::ranges::count_if(number, [&](std::size_t at) {
    const int now = series.unnumbered.y[at];
    return std::abs(now - series.numbered.y[at]) < std::abs(now - series.neutral.y[at]);
  });
  return expect(static_cast<std::size_t>(left) * 2 < number.size(), "the pixels of the number as before",
                left, " of ", number.size(), " still show it");
}

struct Row {
  const char *name;
  const char *proves;
  const char *meaning;
  Result (*run)(const PictureSeries &series);
};
constexpr const char *kProperty = "The picture settings of the program do nothing, or something else.";
constexpr const char *kPrivacy = "A privacy mask hides nothing, or hides too much.";
constexpr Row kRows[] = {
    {"brightness.up", "A higher brightness makes the picture lighter.", kProperty,
     [](const PictureSeries &series) {
       return rises("mean luma", luma(series.neutral), luma(series.bright), 8);
     }},
    {"brightness.down", "A lower brightness makes the picture darker.", kProperty,
     [](const PictureSeries &series) {
       return rises("mean luma", luma(series.dark), luma(series.neutral), 8);
     }},
    {"contrast.up", "A higher contrast spreads the luma.", kProperty,
     [](const PictureSeries &series) {
       return rises("deviation of the luma", contrast(series.neutral), contrast(series.strong), 5);
     }},
    {"contrast.down", "A lower contrast flattens the luma.", kProperty,
     [](const PictureSeries &series) {
       return rises("deviation of the luma", contrast(series.weak), contrast(series.neutral), 5);
     }},
    {"saturation.up", "A higher saturation makes colours stronger.", kProperty,
     [](const PictureSeries &series) {
       return rises("mean colour", colour(series.neutral), colour(series.colourful), 3);
     }},
    {"saturation.down", "Saturation 0 makes the picture grey.", kProperty,
     [](const PictureSeries &series) {
       return expect(colour(series.grey) < 3, "mean colour below 3", colour(series.grey));
     }},
    {"hue", "Hue changes the colours and not the luma.", kProperty, hue},
    {"back", "Neutral properties bring the picture back.", kProperty, back},
    {"other-camera", "The properties of a camera do not change another camera.", kProperty,
     [](const PictureSeries &series) {
       const double found = contrast(series.other_during) - contrast(series.other_before);
       return expect(std::abs(found) < 5, "the same contrast", "a change of ", found);
     }},
    {"mask.flat", "A privacy mask is flat.", kPrivacy, mask_flat},
    {"mask.only-there", "Outside the mask the picture stays.", kPrivacy, mask_only_there},
    {"mask.back", "The picture is whole again without the mask.", kPrivacy, mask_back},
    {"number.shows", "The channel number appears in the encoded picture.",
     "Recordings do not tell their camera.", number_shows},
    {"number.hides", "The channel number disappears.", "Recordings have a number that nobody wants.",
     number_hides},
};

}  // namespace

void add_picture_series(Checks &checks, const std::function<PictureSeries(Bench &)> &take) {
  const auto taken = std::make_shared<Lazy<PictureSeries>>();
  for (const Row &row : kRows)
    checks.push_back({words("picture.", row.name), row.proves, row.meaning, true,
                      [taken, take, run = row.run](Bench &bench) {
                        if (bench.cameras() == 0) return skipped("no camera is plugged in");
                        const PictureSeries &series = taken->get([&] { return take(bench); });
                        if (contrast(series.neutral) < 6)
                          return skipped("the picture of the camera has no details");
                        return run(series);
                      }});
}

void add_picture(Checks &checks) {
  add_picture_series(checks, take_series);
}

}  // namespace contract
