// Fetches preview pictures with the SDK.
#include "preview_picture.h"

#include <chrono>
#include <stdexcept>
#include <thread>

#include "recording.h"
#include "recording/header.h"

namespace contract {

Image settled_preview(HANDLE card) {
  // The card may have begun to compose the first pictures before the call. It never draws into the buffer
  // that was read last, so another address is a new picture.
  constexpr int kSkip = 4;
  constexpr double kLimit = 2.0;
  const auto whole_size =
      recording::picture_size(SCALE_ZV_D1, static_cast<ZV_VIDEO_STANDARD>(zv_GetVideoStandard(card)),
                              static_cast<ZV_RESOLUTION>(zv_GetResolution(card)));
  const auto width = static_cast<u32>(whole_size.width), height = static_cast<u32>(whole_size.height);
  u8 *picture = nullptr;
  int size = 0, pictures = 0;
  const double start = monotonic_seconds();
  while (monotonic_seconds() - start < kLimit) {
    const u8 *const before = picture;
    size = zv_GetPreviewScreen(card, &picture);
    const bool whole = size == static_cast<int>(width * height * 2) && picture != nullptr;
    if (whole && picture != before && ++pictures > kSkip) return unpacked(picture, width, height);
    std::this_thread::sleep_for(std::chrono::milliseconds(4));
  }
  throw std::runtime_error(pictures > 0
                               ? "the preview stands still"
                               : "no preview picture of the right size comes; the last read returns " +
                                     std::to_string(size));
}

}  // namespace contract
