/**
 * @file motion_and_zoom.cpp
 * Counts the frames that the callback gets with the motion flag, and saves preview pictures with
 * picture-in-picture and zoom as PPM files.
 */
#include <algorithm>
#include <array>
#include <atomic>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <thread>

#include "programs/common/card.h"
#include "programs/common/command_line.h"
#include "zv_display.h"

namespace {

constexpr char kHelp[] =
    "Usage: zarvo_motion [DIR]\n"
    "Counts frames with motion, and saves preview pictures in DIR or the working directory.\n\n"
    "  -h, --help   this text\n"
    "  --version    the version\n";

constexpr u32 kWidth = 720;
constexpr u32 kHeight = 480;
constexpr u32 kPipChannel = 6;        // the seventh camera
constexpr u32 kFramesPerCamera = 60;  // two seconds

struct Tags {
  std::atomic<u32> frames{0};
  std::atomic<u32> with_motion{0};
};
std::array<Tags, ZV_CHANNELS> tags;

void on_frame(u32 channel, u8 *, i32, i32 flags) {
  if (flags & ZV_FLAG_MOTION) ++tags[channel].with_motion;
  ++tags[channel].frames;
}

/// Calls `done` every few milliseconds until it returns true. Throws after ten seconds.
template <typename Done>
void wait_for(const char *what, Done done) {
  const auto latest = std::chrono::steady_clock::now() + std::chrono::seconds(10);
  while (!done()) {
    if (std::chrono::steady_clock::now() > latest)
      throw std::runtime_error(std::string("no ") + what + " came");
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
  }
}

void count_motion(HANDLE card) {
  ZV_VIDEO_CONFIG config{};
  config.scale = SCALE_ZV_CIF;
  config.gop = 30;
  config.qp = 8;
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) {
    check(zv_SetVideoEncodeConfig(card, channel, &config), "zv_SetVideoEncodeConfig");
  }
  check(zv_EnableVideoRecordChannels(card, (1u << ZV_CHANNELS) - 1), "zv_EnableVideoRecordChannels");
  check(zv_RegisterCallBack(card, on_frame, nullptr, nullptr), "zv_RegisterCallBack");
  check(zv_StartMotionDetection(card), "zv_StartMotionDetection");
  check(zv_Start(card), "zv_Start");
  wait_for("frames", [] {
    return std::ranges::all_of(tags, [](const Tags &camera) { return camera.frames >= kFramesPerCamera; });
  });
  check(zv_Stop(card), "zv_Stop");
  check(zv_StopMotionDetection(card), "zv_StopMotionDetection");
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) {
    std::printf("camera %2u: motion in %u of %u frames\n", channel + 1, tags[channel].with_motion.load(),
                tags[channel].frames.load());
  }
}

u8 clip(double value) {
  return static_cast<u8>(std::clamp(value, 0.0, 255.0));
}

/// Converts a packed UYVY picture (ITU-R BT.601) to PPM and saves it.
void save_ppm(const u8 *picture, const std::filesystem::path &path) {
  std::ofstream out(path, std::ios::binary);
  out << "P6\n" << kWidth << ' ' << kHeight << "\n255\n";
  for (u32 at = 0; at < kWidth * kHeight * 2; at += 4) {
    const double u = picture[at] - 128.0;
    const double v = picture[at + 2] - 128.0;
    for (const u32 luma : {at + 1, at + 3}) {
      const double y = 1.164 * (picture[luma] - 16.0);
      out.put(static_cast<char>(clip(y + 1.596 * v)));
      out.put(static_cast<char>(clip(y - 0.392 * u - 0.813 * v)));
      out.put(static_cast<char>(clip(y + 2.017 * u)));
    }
  }
  if (!out.flush()) throw std::runtime_error("cannot write " + path.string());
  std::printf("saved %s\n", path.c_str());
}

/// Saves the current preview picture. Skips pictures that the card may have composed before the last
/// change. A new picture is recognised by its address: the card never composes into the buffer that was
/// read last.
void save_preview(HANDLE card, const std::filesystem::path &path) {
  constexpr int kSkip = 6;
  u8 *picture = nullptr;
  int pictures = 0;
  wait_for("preview picture", [&] {
    const u8 *const before = picture;
    if (zv_GetPreviewScreen(card, &picture) == static_cast<int>(kWidth * kHeight * 2))
      pictures += picture != before;
    return pictures > kSkip;
  });
  save_ppm(picture, path);
}

void accept(int result, const char *call) {
  if (result != 0) throw std::runtime_error(std::string(call) + " was refused");
}

void show_windows(HANDLE card, const std::filesystem::path &folder) {
  ZV_DISPLAY *display = zv_display_open(card, MUX_MODE_ZV_1CH);
  if (!display) throw std::runtime_error("zv_display_open failed");
  check(zv_EnablePreviewChannels(card, (1u << ZV_CHANNELS) - 1), "zv_EnablePreviewChannels");
  save_preview(card, folder / "plain.ppm");

  accept(zv_display_pip(display, kPipChannel, 456, 24), "zv_display_pip");
  save_preview(card, folder / "picture-in-picture.ppm");
  accept(zv_display_pip_move(display, -432, 272), "zv_display_pip_move");
  save_preview(card, folder / "picture-in-picture-moved.ppm");
  accept(zv_display_pip(display, -1, 0, 0), "zv_display_pip");

  accept(zv_display_zoom(display, 1, kWidth / 4, kHeight / 4), "zv_display_zoom");
  save_preview(card, folder / "zoom.ppm");
  accept(zv_display_zoom(display, 0, 0, 0), "zv_display_zoom");
  check(zv_EnablePreviewChannels(card, 0), "zv_EnablePreviewChannels");
}

/// Returns the folder for the pictures.
std::filesystem::path parse_folder(int argc, char **argv) {
  static const option kOptions[] = {COMMON_OPTIONS};
  next_option(argc, argv, kOptions, kHelp);
  if (argc - optind > 1) throw UsageError("more than one folder");
  return optind < argc ? argv[optind] : ".";
}

}  // namespace

int main(int argc, char **argv) {
  try {
    const std::filesystem::path folder = parse_folder(argc, argv);
    std::filesystem::create_directories(folder);
    Card card;
    check(zv_SetVideoStandard(card.handle, VIDEO_STANDARD_ZV_NTSC), "zv_SetVideoStandard");
    check(zv_SetResolution(card.handle, RESOLUTION_ZV_720), "zv_SetResolution");
    count_motion(card.handle);
    show_windows(card.handle, folder);
    return 0;
  } catch (const UsageError &error) {
    std::fprintf(stderr, "zarvo_motion: %s\n", error.what());
    return 2;
  } catch (const std::exception &error) {
    std::fprintf(stderr, "zarvo_motion: %s\n", error.what());
    return 1;
  }
}
