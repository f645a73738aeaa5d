// Sixteen CIF channels at 30 frames a second with four audio inputs for twenty seconds of real time, as
// zarvo_record takes them: what the card loses, and what the whole process costs, card included.
#include <benchmark/benchmark.h>

#include <atomic>
#include <chrono>
#include <cstdlib>
#include <thread>

#include "measure.h"
#include "report.h"
#include "zv_lib.h"

namespace {

std::atomic<std::uint64_t> frames{0};
std::atomic<std::uint64_t> blocks{0};

void sixteen_channels(benchmark::State &state) {
  constexpr int kSeconds = 20;
  for (auto iteration : state) {
    (void)iteration;
    virtual_card::reset();
    HANDLE card = nullptr;
    if (zv_Open(&card) != ZV_OK) std::abort();
    zv_SetVideoStandard(card, VIDEO_STANDARD_ZV_NTSC);
    zv_SetResolution(card, RESOLUTION_ZV_720);
    zv_RegisterCallBack(
        card, [](u32, u8 *, i32, i32) { ++frames; }, nullptr, [](u32, u8 *, i32, i32) { ++blocks; });
    ZV_VIDEO_CONFIG config{};
    config.scale = SCALE_ZV_CIF;
    config.gop = 30;
    config.qp = 4;
    for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) zv_SetVideoEncodeConfig(card, channel, &config);
    zv_EnableVideoRecordChannels(card, 0xFFFF);
    zv_EnableAudioChannels(card, 0xF);
    const double before = bench::process_cpu_ns();
    zv_Start(card);
    std::this_thread::sleep_for(std::chrono::seconds(kSeconds));
    const virtual_card::Counters counters = virtual_card::counters();
    const double cores = (bench::process_cpu_ns() - before) / 1e9 / kSeconds;
    zv_Stop(card);
    zv_Close(card);
    bench::figure("16 CIF channels, 20 s: frames and blocks lost by the card",
                  static_cast<double>(counters.mpeg4.lost + counters.mjpeg.lost + counters.audio.lost), 0,
                  "");
    // Twenty seconds of 30000/1001 pictures are 599.4 a channel; two are under way at either end.
    bench::figure("16 CIF channels, 20 s: MPEG-4 frames short of 16 x 597",
                  16.0 * 597 - static_cast<double>(frames), 0, "");
    bench::figure("16 CIF channels, 20 s: audio blocks short of 4 x 1245",
                  4.0 * 1245 - static_cast<double>(blocks), 0, "");
    bench::figure("16 CIF channels, 20 s: processor cores, card included", cores, 1.0, "");
  }
}
BENCHMARK(sixteen_channels)->Iterations(1)->Unit(benchmark::kSecond);

}  // namespace
