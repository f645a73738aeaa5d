// What an hour of one channel costs as a clip: zarvo_export against a stream copy by ffmpeg of the same file,
// and the memory for an hour against that for six minutes.
#include <benchmark/benchmark.h>

#include <atomic>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <thread>
#include <vector>

#include "measure.h"
#include "recording/header.h"
#include "report.h"
#include "virtual_card.h"
#include "zv_lib.h"

namespace {

namespace fs = std::filesystem;

constexpr int kFrames = 240;  // whole groups, eight seconds
std::atomic<int> frames{0};
std::string stream;

/// Takes a stream of the first camera.
void take_stream() {
  HANDLE card = nullptr;
  if (zv_Open(&card) != ZV_OK) std::abort();
  zv_SetVideoStandard(card, VIDEO_STANDARD_ZV_NTSC);
  zv_SetResolution(card, RESOLUTION_ZV_720);
  zv_RegisterCallBack(
      card,
      [](u32, u8 *data, i32 length, i32) {
        if (frames++ < kFrames)
          stream.append(reinterpret_cast<char *>(data), static_cast<std::size_t>(length));
      },
      nullptr, nullptr);
  ZV_VIDEO_CONFIG config{};
  config.scale = SCALE_ZV_CIF;
  config.gop = 30;
  config.qp = 4;
  zv_SetVideoEncodeConfig(card, 0, &config);
  zv_EnableVideoRecordChannels(card, 1);
  zv_Start(card);
  while (frames < kFrames) std::this_thread::sleep_for(std::chrono::milliseconds(10));
  zv_Stop(card);
  zv_Close(card);
}

void write_recording(const fs::path &path, int seconds) {
  const RECORD_FILE_HEADER header = recording::make_header(VIDEO_CODEC_ZV_MPEG4, {352, 240}, "30", 0);
  std::ofstream file(path, std::ios::binary);
  file.write(reinterpret_cast<const char *>(&header), sizeof header);
  for (int written = 0; written < seconds * 30; written += kFrames) file << stream;
}

void export_an_hour(benchmark::State &state) {
  for (auto iteration : state) {
    (void)iteration;
    take_stream();
    const bench::Folder own;
    const fs::path &folder = own.path();
    write_recording(folder / "hour.rec", 3600);
    write_recording(folder / "short.rec", 360);
    const auto exported = [&](const char *recording, const std::string &type) {
      return bench::run_program({ZARVO_EXPORT, "--force", folder / recording, folder / ("ours." + type)});
    };
    for (const std::string type : {"mkv", "mp4"}) {
      bench::compare(
          "an hour of one channel as " + type + ", against ffmpeg -c copy", 5, 1.2,
          [&] { return exported("hour.rec", type).wall_ns; },
          [&] {
            return bench::run_program({"ffmpeg", "-nostdin", "-v", "error", "-y", "-f", "m4v", "-framerate",
                                       "30000/1001", "-skip_initial_bytes", "32", "-i", folder / "hour.rec",
                                       "-c", "copy", folder / ("theirs." + type)})
                .wall_ns;
          });
    }
    bench::figure("memory for an hour as mkv, against six minutes",
                  exported("hour.rec", "mkv").kilobytes / exported("short.rec", "mkv").kilobytes, 1.1, "x");
  }
}
BENCHMARK(export_an_hour)->Iterations(1)->Unit(benchmark::kSecond);

}  // namespace
