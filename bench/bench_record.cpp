// What a frame costs from the card's read to the file: sixteen CIF channels and four audio inputs of
// ready-made frames through the SDK and the dialog's callbacks, against a bare loop of the same driver calls
// with one write() a chunk, and against a stream copy by ffmpeg. Every figure is the difference between a
// long and a short run, so that start and stop do not count.
#include <benchmark/benchmark.h>
#include <unistd.h>

#include <QApplication>
#include <atomic>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "app_state.h"
#include "demodialog.h"
#include "recordings.h"
#include "report.h"
#include "zv_lib.h"

namespace {

namespace fs = bench::fs;

std::atomic<int> hours_ahead{0};

/// The one Qt application of the process, which stands before the first dialog and never ends.
struct Application {
  Application() {
    static int argc = 1;
    static char name[] = "bench_record";
    static char *argv[] = {name, nullptr};
    setenv("QT_QPA_PLATFORM", "offscreen", 1);
    static const QApplication application(argc, argv);
  }
};

/// The program's own recording: sixteen CIF channels and four audio inputs under a root of its own.
class Recording {
 public:
  explicit Recording(const fs::path &root, bool mjpeg = false) {
    std::snprintf(g_filepath, sizeof g_filepath, "%s", root.c_str());
    dialog_.comboQualityMode->setCurrentIndex(1);
    dialog_.UpdateEncodeInfo();
    dialog_.comboCodec->setCurrentIndex(mjpeg ? 1 : 0);
    dialog_.UpdateCodecInfo();
    g_audio_ch = 0xF;
  }
  ~Recording() { dialog_.ExitDialog(); }
  DemoDialog &dialog() { return dialog_; }

 private:
  Application application_;
  DemoDialog dialog_;
};

double record(const fs::path &folder, std::uint64_t frames, bool mjpeg, bool paced) {
  virtual_card::reset();
  virtual_card::set_supply(bench::supply_of(frames, paced));
  Recording recording(folder, mjpeg);
  const double cost = bench::cpu_of_new_threads([&] { recording.dialog().StartRecord(); },
                                                [&] { bench::wait_for_the_end(frames, mjpeg); });
  recording.dialog().StopRecord();
  return cost;
}

void against_bare_calls(benchmark::State &state) {
  for (auto iteration : state) {
    (void)iteration;
    for (const bool mjpeg : {false, true})
      bench::compare_with_bare_calls(std::string("record ") + (mjpeg ? "Motion JPEG" : "MPEG-4") +
                                         " as fast as given, against bare calls and write()",
                                     1.15, mjpeg, record);
  }
}
BENCHMARK(against_bare_calls)->Iterations(1)->Unit(benchmark::kSecond);

void against_ffmpeg(benchmark::State &state) {
  for (auto iteration : state) {
    (void)iteration;
    bench::compare_with_ffmpeg("record Motion JPEG as fast as given, against ffmpeg -c copy", 0.75, 4800,
                               true, false, record);
    bench::compare_with_ffmpeg("record MPEG-4 at 480 frames/s, against ffmpeg -re -c copy", 0.9, 960, false,
                               true, record);
  }
}
BENCHMARK(against_ffmpeg)->Iterations(1)->Unit(benchmark::kSecond);

/// How long stop and start of all twenty files take beyond the pause, against the SDK calls of a rotation
/// alone, which have pauses of their own.
void rotation(benchmark::State &state) {
  using clock = std::chrono::steady_clock;
  const auto ms_since = [](clock::time_point start) {
    return std::chrono::duration<double, std::milli>(clock::now() - start).count();
  };
  for (auto iteration : state) {
    (void)iteration;
    const bench::Folder folder;
    virtual_card::reset();
    virtual_card::set_supply(bench::supply_of(~std::uint64_t{0}, true));
    Recording recording(folder.path());
    std::vector<double> with_files;
    std::vector<double> without;
    for (int round = 0; round < 5; ++round) {
      recording.dialog().StartRecord();
      hours_ahead += 1;
      const auto start = clock::now();
      recording.dialog().TimerTick();
      with_files.push_back(ms_since(start) - 1000);
      recording.dialog().StopRecord();

      ZV_VIDEO_CONFIG config = zv_config;
      const auto sdk_alone = [&] {
        for (u32 channel = 0; channel < ZV_CHANNELS; ++channel)
          zv_SetVideoEncodeConfig(zv_handle, channel, &config);
        usleep(300);
        zv_EnableVideoRecordChannels(zv_handle, 0xFFFF);
        zv_EnableAudioChannels(zv_handle, 0xF);
        usleep(300);
        zv_Start(zv_handle);
      };
      sdk_alone();
      const auto bare_start = clock::now();
      zv_Stop(zv_handle);
      usleep(100);
      sdk_alone();
      without.push_back(ms_since(bare_start));
      zv_Stop(zv_handle);
    }
    bench::note("rotation of 20 files beyond its one-second pause", bench::median(with_files), "ms");
    bench::figure("rotation of 20 files beyond its pause and the SDK's own pauses",
                  bench::median(with_files) - bench::median(without), 1000.0 / 30, "ms");
  }
}
BENCHMARK(rotation)->Iterations(1)->Unit(benchmark::kSecond);

}  // namespace

// The wall clock, some hours ahead: a rotation opens files that are not there yet.
extern "C" time_t time(time_t *result) noexcept {
  timespec now{};
  clock_gettime(CLOCK_REALTIME_COARSE, &now);
  now.tv_sec += time_t{hours_ahead} * 3600;
  if (result != nullptr) *result = now.tv_sec;
  return now.tv_sec;
}
