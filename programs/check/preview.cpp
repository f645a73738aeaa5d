// Theme preview: size, rate, layouts, picture-in-picture, zoom.
#include "bench.h"
#include "check.h"
#include "preview_picture.h"
#include "streams.h"
#include "zv_display.h"

namespace contract {
namespace {

constexpr u32 kAll = (1u << ZV_CHANNELS) - 1;
constexpr double kAlike = 4, kApart = 8;  ///< differences of two pictures, a second apart
constexpr double kDistinct = 3;           ///< least difference of two cameras in the same picture

/// The card with a layout, all windows enabled.
ZV_DISPLAY &layout(Bench &bench, u32 mode, u32 standard = VIDEO_STANDARD_ZV_NTSC,
                   u32 resolution = RESOLUTION_ZV_720) {
  HANDLE card = bench.sdk(standard, resolution);
  ZV_DISPLAY *const display = zv_display_open(card, mode);
  if (display == nullptr || zv_EnablePreviewChannels(card, kAll) != ZV_OK)
    throw std::runtime_error("the SDK refuses the layout");
  return *display;
}

Area area_of(const ZV_DISPLAY_WINDOW &window) {
  constexpr u32 kBorder = 6;
  return {window.x_start + kBorder, window.y_start + kBorder, window.x_end - kBorder, window.y_end - kBorder};
}

Result results(Bench &bench) {
  for (const OtherRead &picture : bench.capture().preview)
    if (picture.result != 720 * 480 * 2) return broken("691200 bytes", words(picture.result));
  return bench.capture().preview.empty() ? broken("pictures", "none") : held();
}

Result indexes(Bench &bench) {
  for (const OtherRead &picture : bench.capture().preview)
    if (picture.index >= driver::kPreviewBuffers) return broken("an index from 0 to 3", words(picture.index));
  return bench.capture().preview.empty() ? broken("pictures", "none") : held();
}

Result rate(Bench &bench) {
  const auto &reads = bench.capture().preview;
  const double seconds = reads.empty() ? 1 : bench.capture().end - reads.front().time;
  // The first picture counts for the time from the last one to the end.
  return expect_between("pictures a second", static_cast<double>(new_pictures(reads) + 1) / seconds, 28,
                        31.5);
}

Result ends(Bench &bench) {
  const Nodes &nodes = bench.nodes();
  nodes.issue(kDisplay, driver::DISP_IOC_PREVIEW_ON);
  pause_for(0.2);
  nodes.issue(kDisplay, driver::DISP_IOC_PREVIEW_OFF);
  u32 index = 0;
  const long result = read_preview(nodes.fd(kDisplay), index);
  return expect(result == 0, "no picture after the end", "result ", result);
}

Result size(Bench &bench, u32 standard, u32 resolution) {
  layout(bench, MUX_MODE_ZV_1CH, standard, resolution);
  settled_preview(bench.sdk());
  return held();
}

Result distinct_windows(Bench &bench, u32 mode) {
  const ZV_DISPLAY &display = layout(bench, mode);
  const u32 cameras = bench.cameras();
  const Image image = settled_preview(bench.sdk());
  std::vector<Area> areas;
  for (const ZV_DISPLAY_WINDOW &window : display.window) {
    if (window.scale == 0 || (cameras >> window.channel & 1) == 0) continue;
    if (tones(image, area_of(window)).deviation < 4)
      return skipped(words("camera ", window.channel + 1, " shows a picture without details"));
    areas.push_back(area_of(window));
  }
  if (areas.empty()) return skipped("no camera is plugged in");
  for (std::size_t one = 0; one < areas.size(); ++one)
    for (std::size_t other = one + 1; other < areas.size(); ++other)
      if (const double found = difference(image, areas[one], image, areas[other]); found < kDistinct)
        return broken(words(areas.size(), " different pictures"),
                      words("windows ", one + 1, " and ", other + 1, " differ by ", found));
  return held();
}

/// Skips what compares cameras when there are none.
std::optional<Result> lacks_cameras(Bench &bench, u32 channels) {
  if ((bench.cameras() & channels) == channels) return {};
  return skipped(words("this needs cameras at the channels of mask 0x", std::hex, channels));
}

Result focus(Bench &bench) {
  if (const auto lacks = lacks_cameras(bench, 0x21)) return *lacks;
  HANDLE card = bench.sdk();
  layout(bench, MUX_MODE_ZV_1CH);
  const u32 before = zv_GetFocusChannel(card);
  const u32 other = before == 5 ? 0 : 5;
  const Image first = settled_preview(card);
  zv_SetFocusChannel(card, other);
  zv_SetPreviewMode(card, MUX_MODE_ZV_1CH);
  const Image second = settled_preview(card);
  zv_SetFocusChannel(card, before);
  zv_SetPreviewMode(card, MUX_MODE_ZV_1CH);
  const Image third = settled_preview(card);
  const double changed = difference(first, first.all(), second, second.all());
  const double back = difference(first, first.all(), third, third.all());
  return expect(changed > kApart && back < kAlike, "another camera, and then the first again", "changes of ",
                changed, " and ", back);
}

Result disabled(Bench &bench) {
  const ZV_DISPLAY &display = layout(bench, MUX_MODE_ZV_4CH);
  zv_EnablePreviewChannels(bench.sdk(), kAll & ~2u);
  const Image image = settled_preview(bench.sdk());
  const Tones found = tones(image, area_of(display.window[1]));
  zv_EnablePreviewChannels(bench.sdk(), kAll);
  return expect(found.luma < 24 && found.deviation < 2, "a black window", "luma ", found.luma, ", deviation ",
                found.deviation);
}

struct PipPictures {
  Image before, during, after;
  Area area;
};

PipPictures pip_pictures(Bench &bench) {
  HANDLE card = bench.sdk();
  ZV_DISPLAY &display = layout(bench, MUX_MODE_ZV_1CH);
  PipPictures pictures;
  pictures.before = settled_preview(card);
  if (zv_display_pip(&display, 5, 440, 24) != 0) throw std::runtime_error("zv_display_pip is refused");
  pictures.area = area_of(*display.pip);
  pictures.during = settled_preview(card);
  zv_display_pip(&display, -1, 0, 0);
  pictures.after = settled_preview(card);
  return pictures;
}

Result pip_shows(Bench &bench) {
  if (const auto lacks = lacks_cameras(bench, 0x21)) return *lacks;
  const PipPictures pictures = pip_pictures(bench);
  const Area rest{0, 300, 400, 480};
  const double inside = difference(pictures.before, pictures.area, pictures.during, pictures.area);
  const double outside = difference(pictures.before, rest, pictures.during, rest);
  return expect(inside > kApart && outside < kApart, "another picture in the small window only", "inside it ",
                inside, ", outside ", outside);
}

Result pip_ends(Bench &bench) {
  const PipPictures pictures = pip_pictures(bench);
  const double found = difference(pictures.before, pictures.area, pictures.after, pictures.area);
  return expect(found < kApart, "the picture as before", "a difference of ", found);
}

/// Compares a zoomed picture with the plain one and with the magnified part of it.
Result zoom(Bench &bench) {
  HANDLE card = bench.sdk();
  if (const auto lacks = lacks_cameras(bench, 1)) return *lacks;
  ZV_DISPLAY &display = layout(bench, MUX_MODE_ZV_1CH);
  const Image plain = settled_preview(card);
  if (zv_display_zoom(&display, 1, 0, 0) != 0) return broken("zoom works", "it is refused");
  const Image zoomed = settled_preview(card);
  zv_display_zoom(&display, 0, 0, 0);
  const Image after = settled_preview(card);
  const Area part{0, 0, display.width / 2, display.height / 2};
  const double magnified = difference(plain, part, zoomed, zoomed.all());
  const double same = difference(plain, plain.all(), zoomed, zoomed.all());
  const double back = difference(plain, plain.all(), after, after.all());
  return expect(magnified < same && back < kAlike, "a part of the picture, and then the whole again",
                "a difference of ", magnified, " from the part, ", same, " from the whole, ", back,
                " at the end");
}

constexpr CheckRow kRows[] = {
    {"read.no-error", "No read of a preview picture fails.", "The preview ends with an error.",
     [](Bench &bench) { return no_read_error(bench.capture(), 3); }},
    {"read.size", "A read returns the bytes of a picture.", "The preview stays black.", results},
    {"read.index", "A read names one of the four buffers.", "The preview stands still or shows rubbish.",
     indexes},
    {"start.soon", "The first picture comes within half a second.", "The preview begins late.",
     [](Bench &bench) { return starts_soon(bench.capture(), bench.capture().preview); }},
    {"rate", "About 30 new pictures a second come, in changing buffers.",
     "The preview stands still or stutters.", rate},
    {"off", "No picture comes after the end.", "The next preview begins with an old picture.", ends},
    {"focus", "The focus channel takes the first window.",
     "An operator enlarges another camera than he has chosen.", focus},
    {"window.disabled", "A disabled window is black.", "A camera that is switched off stays visible.",
     disabled},
    {"pip.shows", "Picture-in-picture shows another camera in a small window.",
     "The small picture is missing or covers others.", pip_shows},
    {"pip.ends", "The small window goes when picture-in-picture ends.", "A part of the picture stays hidden.",
     pip_ends},
    {"zoom", "Zoom magnifies a part, and ends.", "The operator sees another part than he has chosen.", zoom},
};

}  // namespace

void add_preview(Checks &checks) {
  add_rows(checks, "preview", kRows);
  for (const u32 standard : {u32{VIDEO_STANDARD_ZV_NTSC}, u32{VIDEO_STANDARD_ZV_PAL}})
    for (const u32 resolution : {u32{RESOLUTION_ZV_720}, u32{RESOLUTION_ZV_704}})
      checks.push_back(
          {words("preview.size.", name_of(standard), ".", resolution == RESOLUTION_ZV_704 ? 704 : 720),
           "The picture has the size of the standard and the width.", "The preview is torn.", true,
           [=](Bench &bench) { return size(bench, standard, resolution); }});
  constexpr std::array<const char *, MUX_MODE_ZV_INVALID> kLayouts{"1", "4", "6", "8", "9", "16"};
  for (u32 mode = 0; mode < kLayouts.size(); ++mode)
    checks.push_back(
        {words("preview.layout.", kLayouts[mode]),
         words("The layout shows ", kLayouts[mode], mode == 0 ? " picture." : " different pictures."),
         "A camera is missing in the preview.", true,
         [mode](Bench &bench) { return distinct_windows(bench, mode); }});
}

}  // namespace contract
