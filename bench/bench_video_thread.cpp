// What the SDK's video thread costs per frame, against a bare loop of the same driver calls on the same
// ready-made frames; what it copies; what it allocates.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstdlib>
#include <semaphore>
#include <thread>

#include "measure.h"
#include "report.h"
#include "zv_lib.h"

namespace {

constexpr std::uint64_t kFrames = 1000;
constexpr std::size_t kFrameSize = 10240;

/// What the callbacks see; they run on the video thread alone.
struct Watch {
  std::uint64_t frames = 0;
  double first_ns = 0;
  double last_ns = 0;
  std::uint64_t first_allocations = 0;
  std::uint64_t last_allocations = 0;
  std::size_t changed = 0;  ///< most bytes of a frame that are not as the card wrote them
  std::binary_semaphore done{0};
};
Watch *watch = nullptr;
thread_local std::uint64_t allocations = 0;

void count_frame() {
  const double now = bench::thread_cpu_ns();
  if (watch->frames++ == 0) {
    watch->first_ns = now;
    watch->first_allocations = allocations;
  }
  watch->last_ns = now;
  watch->last_allocations = allocations;
  if (watch->frames == kFrames) watch->done.release();
}

/// Ready-made frames are one byte repeated, so every other byte in front of the EOI was copied in.
void count_copied(const u8 *data, i32 length) {
  if (watch->frames >= 64) return;
  const auto changed = std::count_if(data, data + length, [](u8 byte) { return byte != 0x5A; });
  const std::size_t eoi = 2;
  watch->changed = std::max(watch->changed, static_cast<std::size_t>(changed) - eoi);
}

void on_frame(u32, u8 *data, i32 length, i32) {
  count_copied(data, length);
  count_frame();
}

class Capture {
 public:
  explicit Capture(bool mpeg4) {
    virtual_card::reset();
    virtual_card::set_clock(virtual_card::ClockMode::manual);
    virtual_card::apply("nowait");
    virtual_card::set_supply(bench::ready_made_supply(kFrameSize, mpeg4, !mpeg4, kFrames));
  }
  ~Capture() { virtual_card::clear_supply(); }
};

double sdk_cost(bool mpeg4) {
  const Capture capture(mpeg4);
  HANDLE card = nullptr;
  if (zv_Open(&card) != ZV_OK) std::abort();
  zv_SetVideoStandard(card, VIDEO_STANDARD_ZV_NTSC);
  zv_RegisterCallBack(card, on_frame, on_frame, nullptr);
  ZV_VIDEO_CONFIG config{};
  config.scale = SCALE_ZV_CIF;
  config.gop = 30;
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) zv_SetVideoEncodeConfig(card, channel, &config);
  zv_EnableVideoRecordChannels(card, 0xFFFF);
  zv_Start(card);
  watch->done.acquire();
  zv_Stop(card);
  zv_Close(card);
  return (watch->last_ns - watch->first_ns) / static_cast<double>(kFrames - 1);
}

double bare_cost(bool mpeg4) {
  const Capture capture(mpeg4);
  double cost = 0;
  // In a thread of its own, as the SDK's loop: what a pause costs depends on who is paused.
  std::thread([&cost] {
    bench::BareDriver bare;
    bare.start();
    std::uint64_t frames = 0;
    double first = 0;
    const auto sink = [&](u32, const u8 *data, std::size_t) {
      benchmark::DoNotOptimize(data);
      if (frames++ == 0) first = bench::thread_cpu_ns();
    };
    while (frames < kFrames) bare.pass(sink, sink);
    cost = (bench::thread_cpu_ns() - first) / static_cast<double>(kFrames - 1);
    bare.stop();
  }).join();
  return cost;
}

void video_thread(benchmark::State &state, bool mpeg4, const char *name, std::size_t may_copy) {
  std::size_t copied = 0;
  std::uint64_t allocated = 0;
  for (auto iteration : state) {
    (void)iteration;
    bench::compare(
        std::string("video thread, 10 KiB ") + name + ", against the bare driver loop", 41, 1.10,
        [&] {
          Watch fresh;
          watch = &fresh;
          const double cost = sdk_cost(mpeg4);
          copied = std::max(copied, fresh.changed);
          allocated = std::max(allocated, fresh.last_allocations - fresh.first_allocations);
          return cost;
        },
        [&] { return bare_cost(mpeg4); });
  }
  bench::figure(std::string("bytes copied a frame, ") + name, static_cast<double>(copied),
                static_cast<double>(may_copy), "B");
  bench::figure(std::string("allocations on the frame path, ") + name, static_cast<double>(allocated), 0, "");
}

void mpeg4_frames(benchmark::State &state) {
  video_thread(state, true, "MPEG-4 frames", 20);
}
void mjpeg_frames(benchmark::State &state) {
  video_thread(state, false, "Motion-JPEG frames", 593);
}
BENCHMARK(mpeg4_frames)->Iterations(1)->Unit(benchmark::kMillisecond);
BENCHMARK(mjpeg_frames)->Iterations(1)->Unit(benchmark::kMillisecond);

}  // namespace

// Counts the allocations of the calling thread.
extern "C" void *__libc_malloc(std::size_t size);
extern "C" void *malloc(std::size_t size) {
  ++allocations;
  return __libc_malloc(size);
}
