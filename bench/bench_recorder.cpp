// What a frame costs in zarvo_recorder: callback, buffer, writer, files and index of sixteen CIF channels and
// four audio inputs, against a bare loop of driver calls with one write() a frame, and against a stream copy
// by ffmpeg.
#include <benchmark/benchmark.h>

#include "programs/recorder/recorder.h"
#include "recordings.h"

namespace {

double record(const bench::fs::path &folder, std::uint64_t frames, bool mjpeg, bool paced) {
  virtual_card::reset();
  virtual_card::set_supply(bench::supply_of(frames, paced));
  recorder::Options options;
  options.root = folder;
  options.channels = 0xFFFF;
  options.gop = 30;
  options.codec = mjpeg ? VIDEO_CODEC_ZV_MJPEG : VIDEO_CODEC_ZV_MPEG4;
  recorder::Recorder recording(options);
  const double cost =
      bench::cpu_of_new_threads([&] { recording.start(); }, [&] { bench::wait_for_the_end(frames, mjpeg); });
  recording.stop();
  return cost;
}

void against_bare_calls(benchmark::State &state) {
  for (auto iteration : state) {
    (void)iteration;
    bench::compare_with_bare_calls("zarvo_recorder as fast as given, against bare calls and write()", 1.0,
                                   false, record);
  }
}
BENCHMARK(against_bare_calls)->Iterations(1)->Unit(benchmark::kSecond);

void against_ffmpeg(benchmark::State &state) {
  for (auto iteration : state) {
    (void)iteration;
    bench::compare_with_ffmpeg("zarvo_recorder at 480 frames/s, against ffmpeg -re -c copy", 0.7, 960, false,
                               true, record);
  }
}
BENCHMARK(against_ffmpeg)->Iterations(1)->Unit(benchmark::kSecond);

}  // namespace
