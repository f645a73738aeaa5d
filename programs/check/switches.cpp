// Theme switches: changing standard or width while nothing runs, and during preview.
#include "bench.h"
#include "check.h"
#include "decode.h"
#include "live.h"
#include "preview_picture.h"
#include "recording/header.h"
#include "zv_display.h"

namespace contract {
namespace {

Result width_at_driver(Bench &bench, u32 width) {
  const Nodes &nodes = bench.nodes();
  u32 word = width, now = 0;
  if (const int error = nodes.issue(kVideoInput, driver::VIN_IOC_SET_WIDTH, &word))
    return broken("success", error_name(error));
  nodes.issue(kDisplay, driver::DISP_IOC_GET_WIDTH, &now);
  return expect(now == width, words(width, " pixels of the display"), now);
}

/// Goes from one standard and width to another and expects their display size.
Result during_nothing(Bench &bench, u32 standard, u32 resolution) {
  bench.sdk(VIDEO_STANDARD_ZV_NTSC, RESOLUTION_ZV_720);
  HANDLE card = bench.sdk(standard, resolution);
  const ZV_DISPLAY *const display = zv_display_open(card, MUX_MODE_ZV_1CH);
  if (display == nullptr) return broken("the display opens", "it does not");
  const auto size = recording::picture_size(SCALE_ZV_D1, static_cast<ZV_VIDEO_STANDARD>(standard),
                                            static_cast<ZV_RESOLUTION>(resolution));
  return expect(
      display->width == static_cast<u32>(size.width) && display->height == static_cast<u32>(size.height),
      words(size.width, " x ", size.height), display->width, " x ", display->height);
}

/// settled_preview() fails unless pictures of the new size come.
Result during_preview(Bench &bench, u32 from, u32 to, u32 resolution) {
  HANDLE card = bench.sdk(from, RESOLUTION_ZV_720);
  zv_display_open(card, MUX_MODE_ZV_4CH);
  zv_EnablePreviewChannels(card, 0xF);
  settled_preview(card);
  bench.sdk(to, resolution);
  settled_preview(card);
  zv_EnablePreviewChannels(card, 0);
  return held();
}

/// A capture after a switch has the new size from its first picture on.
Result capture_after(Bench &bench, u32 standard, u32 lines) {
  HANDLE card = bench.sdk(1 - standard, RESOLUTION_ZV_720);
  {
    Live live(card, 1);
    live.picture(0);
  }
  bench.sdk(standard, RESOLUTION_ZV_720);
  Live live(card, 1);
  const Image image = live.picture(0);
  return expect(image.height == lines, words(lines, " lines"), image.height);
}

}  // namespace

void add_switches(Checks &checks) {
  constexpr const char *kCut =
      "After a switch of the standard the picture is cut or torn until the program restarts.";
  for (const u32 width : {704u, 720u})
    checks.push_back({words("switches.width.", width), "The display follows the input width.", kCut, true,
                      [width](Bench &bench) { return width_at_driver(bench, width); }});
  for (const u32 standard : {u32{VIDEO_STANDARD_ZV_NTSC}, u32{VIDEO_STANDARD_ZV_PAL}}) {
    const bool pal = standard == VIDEO_STANDARD_ZV_PAL;
    for (const u32 resolution : {u32{RESOLUTION_ZV_720}, u32{RESOLUTION_ZV_704}}) {
      const char *const width = resolution == RESOLUTION_ZV_704 ? "704" : "720";
      checks.push_back({words("switches.idle.", name_of(standard), ".", width),
                        "Without capture and preview the display takes the new size.", kCut, true,
                        [=](Bench &bench) { return during_nothing(bench, standard, resolution); }});
      checks.push_back({words("switches.preview.to-", name_of(standard), ".", width),
                        "A running preview takes the new size.", kCut, true, [=](Bench &bench) {
                          return during_preview(bench, 1 - standard, standard, resolution);
                        }});
    }
    checks.push_back({words("switches.capture.to-", name_of(standard)), "The next capture has the new size.",
                      kCut, true,
                      [=](Bench &bench) { return capture_after(bench, standard, pal ? 288 : 240); }});
  }
}

}  // namespace contract
