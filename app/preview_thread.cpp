// Shows the card's preview picture on a thread of its own.
#include "preview_thread.h"

#include <pthread.h>
#include <sys/time.h>
#include <unistd.h>

#include "app_state.h"
#include "sdl.h"
#include "zv_lib.h"

namespace {

constexpr u32 kAllChannels = 0xFFFF;
constexpr int kRealTimePriority = 80;
constexpr u32 kNtscPeriod = 33;  // milliseconds for each picture
constexpr u32 kPalPeriod = 40;
constexpr int kNtscLines = 480;
constexpr useconds_t kPause = 1000;  // microseconds; short, so that a stop is noticed at once

pthread_t thread;
bool thread_exists = false;

void set_video_enable(int on) {
  pthread_mutex_lock(&thread_mutex);
  shared(video_enable).store(on, std::memory_order_relaxed);
  pthread_mutex_unlock(&thread_mutex);
}

bool video_enabled() {
  return shared(video_enable).load(std::memory_order_relaxed) != 0;
}

u32 now_ms() {
  timeval now;
  gettimeofday(&now, nullptr);
  return static_cast<u32>(now.tv_sec) * 1000u + static_cast<u32>(now.tv_usec) / 1000u;
}

bool same(u32 on_card, u32 chosen, const char *message) {
  if (on_card != chosen) std::puts(message);
  return on_card == chosen;
}

void enable_channels(u32 mask) {
  sdk_ok(zv_EnablePreviewChannels(zv_handle, mask), "ERROR:zv_EnablePreviewChannels Error");
}

// Turns the card's preview on and checks that standard, mode and resolution of the card are those that the
// operator chose.
bool prepare_card() {
  const std::lock_guard lock(layout_mutex);
  if (!same(zv_GetVideoStandard(zv_handle), zv_format, "ERROR:format does not match")) return false;
  sdk_ok(zv_SetPreviewMode(zv_handle, zv_mode), "ERROR:zv_SetPreviewMode Error");
  if (!same(zv_GetPreviewMode(zv_handle), zv_mode, "ERROR:mode does not match!")) return false;
  enable_channels(kAllChannels);
  return same(zv_GetResolution(zv_handle), zv_resolution, "ERROR:resolution does not match!");
}

// Returns the number of pictures shown, 0 or 1, or -1 when the card has failed.
int show_picture() {
  u8 *picture = nullptr;
  const int length = zv_GetPreviewScreen(zv_handle, &picture);
  if (length < 0) {
    sdk_ok(length, "ERROR:zv_GetPreviewScreen Error!");
    return -1;
  }
  if (picture == nullptr) return 0;  // no new picture, or an unknown buffer
  UpDataYUVScreen(picture, length);
  return 1;
}

// Shows a picture every `period` milliseconds and the frame rate every second. The first picture after a new
// frame rate starts a new sequence of periods.
void show_pictures(u32 period) {
  const u32 start = now_ms();
  u32 next_due = start + period;
  u32 pictures = 0;
  u32 seconds_reported = 0;
  while (video_enabled()) {
    usleep(kPause);
    const u32 now = now_ms();
    const u32 elapsed = (now - start) / 1000u;
    if (elapsed > seconds_reported) {
      UpdateFrameRate(static_cast<int>(pictures));
      seconds_reported = elapsed;
      pictures = 0;
    }
    if (next_due > now) continue;
    next_due = (pictures != 0 ? next_due : now) + period;
    const int shown = show_picture();
    if (shown < 0) return;
    pictures += static_cast<u32>(shown);
  }
}

struct Size {
  int width;
  int height;
};

Size chosen_size() {
  const std::lock_guard lock(layout_mutex);
  return {g_width, g_height};
}

}  // namespace

void *videothread(void *) {
  const Size size = chosen_size();
  if (InitialSDL(size.width, size.height) == 0 && prepare_card()) {
    std::puts("Start video thread");
    show_pictures(size.height == kNtscLines ? kNtscPeriod : kPalPeriod);
    const std::lock_guard lock(layout_mutex);
    enable_channels(0);
  }
  std::puts("Exit video thread");
  CloseSDL();
  return nullptr;
}

bool start_preview_thread() {
  stop_preview_thread();
  join_preview_thread();
  // Set the flag before the thread exists, so that an immediate stop is not lost.
  set_video_enable(1);
  if (pthread_create(&thread, nullptr, videothread, nullptr) != 0) return false;
  thread_exists = true;
  const sched_param priority = {kRealTimePriority};
  pthread_setschedparam(thread, SCHED_RR, &priority);
  return true;
}

void stop_preview_thread() {
  set_video_enable(0);
}

void join_preview_thread() {
  if (thread_exists) pthread_join(thread, nullptr);
  thread_exists = false;
}
