// The exact rates behind the labels.
#include <gtest/gtest.h>

#include <cstdlib>

#include "recording/frame_rates.h"

namespace recording {
namespace {

// Catches: a fraction in another place than its label. NTSC rates are 0.1 % below their labels; the PAL
// labels are rounded.
TEST(FrameRates, FractionsAreThoseOfTheLabels) {
  for (const ZV_VIDEO_STANDARD standard : {VIDEO_STANDARD_ZV_NTSC, VIDEO_STANDARD_ZV_PAL}) {
    std::size_t index = 0;
    for (auto label = frame_rate_list(standard); *label != nullptr; ++label, ++index) {
      const FrameRate rate = exact_frame_rate(standard, index).value();
      const double label_rate = std::atof(*label) * (standard == VIDEO_STANDARD_ZV_NTSC ? 1000.0 / 1001 : 1);
      EXPECT_NEAR(double{1} * rate.numerator / rate.denominator, label_rate, 0.0051) << *label;
    }
    EXPECT_FALSE(exact_frame_rate(standard, index));
  }
}

}  // namespace
}  // namespace recording
