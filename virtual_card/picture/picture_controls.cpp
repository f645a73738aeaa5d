// Applies picture properties to colours and pictures.
#include "picture_controls.h"

#include <algorithm>
#include <cmath>
#include <numbers>

#include "pixel_ops.h"

namespace virtual_card {

namespace {

constexpr double kNeutral = 128.0;
constexpr double kMidLuma = 126.0;
/// Change of luma at full brightness: a quarter of the range from black to white.
constexpr double kBrightnessSpan = 0.25 * (235 - 16);

}  // namespace

PictureControls::PictureControls(const PictureSettings &settings)
    : luma_neutral_(settings.contrast == kNeutral && settings.brightness == kNeutral),
      chroma_neutral_(settings.hue == kNeutral && settings.saturation == kNeutral) {
  const double contrast = settings.contrast / kNeutral;
  const double offset = (settings.brightness - kNeutral) / kNeutral * kBrightnessSpan;
  for (std::size_t i = 0; i < luma_.size(); ++i) {
    const double luma = kMidLuma + (static_cast<double>(i) - kMidLuma) * contrast + offset;
    luma_[i] = static_cast<u8>(std::lround(std::clamp(luma, 1.0, 254.0)));
  }
  const double angle = (settings.hue - kNeutral) * 2.0 * std::numbers::pi / 256.0;
  const double saturation = settings.saturation / kNeutral * 256.0;
  cosine_ = static_cast<int>(std::lround(std::cos(angle) * saturation));
  sine_ = static_cast<int>(std::lround(std::sin(angle) * saturation));
}

Colour PictureControls::apply(Colour colour) const {
  if (!luma_neutral_) colour.y = luma_[colour.y];
  if (!chroma_neutral_) turn_chroma(&colour.cb, &colour.cr, cosine_, sine_, 1);
  return colour;
}

void PictureControls::apply(Picture &picture) const {
  if (!luma_neutral_) map_samples(picture.y.data(), luma_, picture.y.size());
  if (!chroma_neutral_) {
    turn_chroma(picture.cb.data(), picture.cr.data(), cosine_, sine_, picture.cb.size());
  }
}

}  // namespace virtual_card
