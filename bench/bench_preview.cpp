// What one preview picture costs the preview thread (fetch, copy, display) against a bare memcpy of the same
// bytes and the same display call, on SDL's dummy driver.
#include <SDL.h>
#include <benchmark/benchmark.h>

#include <cstdlib>
#include <cstring>

#include "measure.h"
#include "report.h"
#include "sdl.h"
#include "zv_lib.h"

namespace {

constexpr int kPictures = 200;

void preview_picture(benchmark::State &state) {
  setenv("SDL_VIDEODRIVER", "dummy", 1);
  virtual_card::reset();
  HANDLE card = nullptr;
  if (zv_Open(&card) != ZV_OK || InitialSDL(720, 480) != 0) std::abort();
  zv_SetVideoStandard(card, VIDEO_STANDARD_ZV_NTSC);
  zv_SetResolution(card, RESOLUTION_ZV_720);
  zv_SetPreviewMode(card, MUX_MODE_ZV_16CH);
  zv_EnablePreviewChannels(card, 0xFFFF);
  SDL_Overlay *overlay = SDL_CreateYUVOverlay(720, 480, SDL_UYVY_OVERLAY, SDL_GetVideoSurface());
  SDL_Rect whole{0, 0, 720, 480};
  u8 *picture = nullptr;
  while (zv_GetPreviewScreen(card, &picture) <= 0) SDL_Delay(1);

  for (auto iteration : state) {
    (void)iteration;
    bench::compare(
        "preview picture, against memcpy and the same display call", 9, 1.10,
        [&] {
          const double before = bench::thread_cpu_ns();
          for (int i = 0; i < kPictures; ++i) {
            u8 *newest = nullptr;
            const int length = zv_GetPreviewScreen(card, &newest);
            UpDataYUVScreen(newest, length);
          }
          return (bench::thread_cpu_ns() - before) / kPictures;
        },
        [&] {
          const double before = bench::thread_cpu_ns();
          for (int i = 0; i < kPictures; ++i) {
            std::memcpy(overlay->pixels[0], picture, std::size_t{720} * 480 * 2);
            SDL_DisplayYUVOverlay(overlay, &whole);
          }
          return (bench::thread_cpu_ns() - before) / kPictures;
        });
  }
  zv_EnablePreviewChannels(card, 0);
  SDL_FreeYUVOverlay(overlay);
  CloseSDL();
  zv_Close(card);
}
BENCHMARK(preview_picture)->Iterations(1)->Unit(benchmark::kMillisecond);

}  // namespace
