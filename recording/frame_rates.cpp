// The lists of frame rates, and the label for the rate in a header.
#include "recording/frame_rates.h"

#include <cstdlib>
#include <iterator>

const char *const ntsc_fps_str[] = {"30", "27", "25",   "24", "22.5", "20",  "15", "10",   "7.5",
                                    "6",  "5",  "3.75", "3",  "2",    "1.2", "1",  nullptr};
const char *const pal_fps_str[] = {"25",   "22.5", "20.83", "20",   "18.75", "16.67", "12.5", "8.33",
                                   "6.25", "5",    "4.17",  "3.13", "2.5",   "1.67",  "1",    nullptr};

namespace recording {
namespace {

/// The part of a standard's pictures that the card encodes, by index.
constexpr FrameRate kParts[] = {{1, 1}, {9, 10}, {5, 6}, {4, 5}, {3, 4},  {2, 3},  {1, 2},  {1, 3},
                                {1, 4}, {1, 5},  {1, 6}, {1, 8}, {1, 10}, {1, 15}, {1, 25}, {1, 30}};

}  // namespace

const char *const *frame_rate_list(ZV_VIDEO_STANDARD standard) {
  return standard == VIDEO_STANDARD_ZV_NTSC ? ntsc_fps_str : pal_fps_str;
}

std::string frame_rate_label(const RECORD_FILE_HEADER &header) {
  std::string whole = std::to_string(header.frame_rate);
  std::string cut;
  for (auto label = frame_rate_list(standard_of(header)); *label != nullptr; ++label) {
    if (*label == whole) return whole;
    if (cut.empty() && std::atoi(*label) == header.frame_rate) cut = *label;
  }
  return cut.empty() ? whole : cut;
}

std::optional<FrameRate> exact_frame_rate(ZV_VIDEO_STANDARD standard, std::size_t index) {
  const bool ntsc = standard == VIDEO_STANDARD_ZV_NTSC;
  if (index >= (ntsc ? std::size(ntsc_fps_str) : std::size(pal_fps_str)) - 1) return std::nullopt;
  const FrameRate full = ntsc ? FrameRate{30000, 1001} : FrameRate{25, 1};
  return FrameRate{full.numerator * kParts[index].numerator, full.denominator * kParts[index].denominator};
}

}  // namespace recording
