// Theme motion: thresholds, excluded areas, and that tags agree with the status word.
#include "bench.h"
#include "check.h"
#include "lazy.h"
#include "programs/common/card.h"
#include "series.h"

namespace contract {
namespace {

bool scene_moves(const Image &one, const Image &other) {
  constexpr int kClearly = 30;
  constexpr std::size_t kPixels = 200;
  return changed_pixels(one, other, kClearly) > kPixels;
}

MotionSeries take_series(Bench &bench) {
  constexpr double kSettle = 0.5, kLook = 0.4;
  constexpr ZV_RECT kWhole{0, 0, 720, 480};
  HANDLE card = bench.sdk(VIDEO_STANDARD_ZV_NTSC, RESOLUTION_ZV_720);
  const u32 cameras = bench.cameras();
  const u32 camera = first_channel(cameras), other = first_channel(cameras & ~(1u << camera));
  MotionSeries series;
  Live live(card, 1u << camera | 1u << other);
  const Image before = live.picture(camera);
  const auto look = [&](u32 channel) {
    pause_for(kSettle);
    return live.tags(channel, kLook);
  };
  const auto threshold = [&](u32 value) {
    check(zv_SetMotionSensitivity(card, camera, value), "zv_SetMotionSensitivity");
  };
  check(zv_SetMotionSensitivity(card, other, driver::kNeverMoves), "zv_SetMotionSensitivity");
  threshold(driver::kNeverMoves);
  check(zv_StartMotionDetection(card), "zv_StartMotionDetection");
  series.never = look(camera);
  threshold(0);
  series.always = look(camera);
  series.other = live.tags(other, 0.2);
  for (int time = 0; time < 20; ++time, ++series.status_reads) {
    series.status_set += zv_GetMotionStatus(card) >> camera & 1;
    pause_for(0.02);
  }
  check(zv_MarkMotionArea(card, camera, &kWhole, 1), "zv_MarkMotionArea");
  series.excluded = look(camera);
  check(zv_MarkMotionArea(card, camera, &kWhole, 0), "zv_MarkMotionArea");
  series.included = look(camera);
  check(zv_StopMotionDetection(card), "zv_StopMotionDetection");
  series.stopped = look(camera);
  series.moves = scene_moves(before, live.picture(camera));
  return series;
}

Result none(const Live::Tags &tags) {
  return expect(tags.frames > 0 && tags.with_motion == 0, "frames without the motion flag", tags.with_motion,
                " of ", tags.frames, " frames have it");
}

Result most(const Live::Tags &tags) {
  return expect(tags.frames > 0 && tags.with_motion * 2 > tags.frames, "most frames with the motion flag",
                tags.with_motion, " of ", tags.frames, " frames have it");
}

struct Row {
  const char *name;
  const char *proves;
  const char *meaning;
  Result (*run)(const MotionSeries &series);
};
constexpr const char *kMissed = "Motion is not noticed.";
constexpr const char *kFalse = "Motion is reported where there is none.";
constexpr Row kRows[] = {
    {"threshold-0xffff", "The threshold 0xFFFF never reports motion.", kFalse,
     [](const MotionSeries &series) { return none(series.never); }},
    {"threshold-0", "The threshold 0 reports the motion of a moving picture.", kMissed,
     [](const MotionSeries &series) { return most(series.always); }},
    {"status", "The status word agrees with the flags of the frames.",
     "Live view and recordings mark motion differently.",
     [](const MotionSeries &series) {
       const bool tagged = series.always.with_motion * 2 > series.always.frames;
       const bool told = series.status_set * 2 > series.status_reads;
       return expect(tagged == told, tagged ? "the bit is set" : "the bit is clear", series.status_set,
                     " of ", series.status_reads, " reads have it");
     }},
    {"excluded", "An excluded area reports no motion.", kFalse,
     [](const MotionSeries &series) { return none(series.excluded); }},
    {"included", "The area reports motion again when it is included.", kMissed,
     [](const MotionSeries &series) { return most(series.included); }},
    {"stopped", "After the stop no motion is reported.", kFalse,
     [](const MotionSeries &series) { return none(series.stopped); }},
    {"other-camera", "The threshold of a camera does not count for another one.", kFalse,
     [](const MotionSeries &series) { return none(series.other); }},
};

}  // namespace

void add_motion_series(Checks &checks, const std::function<MotionSeries(Bench &)> &take) {
  const auto taken = std::make_shared<Lazy<MotionSeries>>();
  for (const Row &row : kRows)
    checks.push_back({words("motion.", row.name), row.proves, row.meaning, true,
                      [taken, take, run = row.run](Bench &bench) {
                        if (bench.cameras() == 0) return skipped("no camera is plugged in");
                        const MotionSeries &series = taken->get([&] { return take(bench); });
                        return series.moves ? run(series) : skipped("nothing moves in front of the camera");
                      }});
}

void add_motion(Checks &checks) {
  add_motion_series(checks, take_series);
}

}  // namespace contract
