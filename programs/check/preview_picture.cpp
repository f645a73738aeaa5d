// Fetches preview pictures with the SDK.
#include "preview_picture.h"

#include <chrono>
#include <stdexcept>
#include <thread>

#include "recording.h"

namespace contract {

Image settled_preview(HANDLE card) {
  // The card may have begun to compose the first pictures before the call. It never draws into the buffer
  // that was read last, so another address is a new picture.
  constexpr int kSkip = 4;
  constexpr double kLimit = 2.0;
  const u32 width = zv_GetResolution(card) == RESOLUTION_ZV_704 ? 704 : 720;
  const u32 height = zv_GetVideoStandard(card) == VIDEO_STANDARD_ZV_PAL ? 576 : 480;
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
