// The preview window, with SDL 1.2.
#include "sdl.h"

#include <SDL.h>

#include <algorithm>
#include <csignal>
#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <iterator>

SDL_Surface *screen = nullptr;
SDL_Overlay *overlay = nullptr;
SDL_Rect video_rect;
SDL_Event event;

namespace {

constexpr int kBitsPerPixel = 24;
constexpr std::size_t kBytesPerPixel = 2;  // in a UYVY picture

// Copies a picture into the overlay. The rows of the overlay may have padding; those of a picture have none.
void copy_into_overlay(const unsigned char *picture, std::size_t length) {
  const std::size_t row = static_cast<std::size_t>(overlay->w) * kBytesPerPixel;
  const std::size_t pitch = overlay->pitches[0];
  Uint8 *plane = overlay->pixels[0];
  length = std::min(length, row * static_cast<std::size_t>(overlay->h));
  if (pitch == row) {
    std::memcpy(plane, picture, length);
    return;
  }
  for (; length > 0; plane += pitch) {
    const std::size_t part = std::min(length, row);
    std::memcpy(plane, picture, std::min(part, pitch));
    picture += part;
    length -= part;
  }
}

// Initialises SDL and restores the signal handlers that it replaces. SDL turns SIGINT and similar signals
// into events, which this program does not read: Ctrl-C would have no effect during a preview. SDL also
// catches the signals of a crash, which would hide its cause.
int init_without_signals() {
  constexpr int kSignals[] = {SIGINT, SIGTERM, SIGQUIT, SIGALRM, SIGSEGV, SIGBUS, SIGFPE};
  struct sigaction before[std::size(kSignals)];
  for (std::size_t n = 0; n < std::size(kSignals); ++n) sigaction(kSignals[n], nullptr, &before[n]);
  const int status = SDL_Init(SDL_INIT_VIDEO);
  for (std::size_t n = 0; n < std::size(kSignals); ++n) sigaction(kSignals[n], &before[n], nullptr);
  return status;
}

}  // namespace

void set_overlay_environment() {
  // putenv() does not copy the strings, so they are static.
  static char direct[] = "SDL_VIDEO_YUV_DIRECT=1";
  static char accelerated[] = "SDL_VIDEO_YUV_HWACCEL=1";
  putenv(direct);
  putenv(accelerated);
}

int InitialSDL(int width, int height) {
  set_overlay_environment();
  if (init_without_signals() != 0) {
    std::printf("Initial SDL error: %s\n", SDL_GetError());
    return -1;
  }
  screen = SDL_SetVideoMode(width, height, kBitsPerPixel, 0);
  if (screen == nullptr) {
    std::printf("Unable to set video mode: %s\n", SDL_GetError());
    return -1;
  }
  SDL_WM_SetCaption("Preview", nullptr);
  overlay = SDL_CreateYUVOverlay(width, height, SDL_UYVY_OVERLAY, screen);
  if (overlay == nullptr) {
    std::printf("Unable to create YUV overlay: %s\n", SDL_GetError());
    return -1;
  }
  video_rect = {0, 0, static_cast<Uint16>(width), static_cast<Uint16>(height)};
  return 0;
}

void UpDataYUVScreen(unsigned char *picture, int length) {
  if (SDL_LockYUVOverlay(overlay) == 0) {
    if (length > 0) copy_into_overlay(picture, static_cast<std::size_t>(length));
    SDL_UnlockYUVOverlay(overlay);
  }
  SDL_DisplayYUVOverlay(overlay, &video_rect);
  // Let SDL reply to the window manager. A request to close the window stays in SDL's queue, without effect.
  SDL_PumpEvents();
}

void UpdateFrameRate(int fps) {
  char caption[128] = {};
  std::snprintf(caption, sizeof caption, "Preview FPS : %d", fps);
  SDL_WM_SetCaption(caption, nullptr);
}

int CheckExitEvent() {
  return SDL_PollEvent(&event) == 1 && event.type == SDL_QUIT ? 1 : 0;
}

void CloseSDL() {
  if (overlay != nullptr) SDL_FreeYUVOverlay(overlay);
  overlay = nullptr;
  screen = nullptr;
  SDL_Quit();
}
