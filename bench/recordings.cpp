#include "recordings.h"

#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <unistd.h>

#include <array>
#include <atomic>
#include <chrono>
#include <cstdlib>
#include <ctime>
#include <thread>
#include <vector>

#include "report.h"

namespace bench {
namespace {

using virtual_card::Supply;

std::atomic<double> paused_ns{0};  // processor time of this process's usleep() calls

constexpr double kVideoRate = 480;
constexpr double kAudioRate = 62.5;

const Supply &streams() {
  static const Supply supply = encoded_supply(60);
  return supply;
}

void append(int file, const u8 *data, std::size_t length) {
  if (write(file, data, length) < 0) std::abort();
}

double bare_ns(std::uint64_t frames, bool mjpeg) {
  const Folder folder;
  virtual_card::reset();
  virtual_card::set_supply(supply_of(frames, false));
  std::array<int, 20> files{};
  for (std::size_t i = 0; i < files.size(); ++i)
    files[i] = open((folder.path() / std::to_string(i)).c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
  BareDriver driver;
  std::atomic<bool> running{true};
  std::thread video;
  std::thread audio;
  const auto start = [&] {
    driver.start();
    video = std::thread([&] {
      const BareDriver::Sink record = [&](u32 channel, const u8 *data, std::size_t length) {
        append(files[channel], data, length);
      };
      const BareDriver::Sink ignore = [](u32, const u8 *data, std::size_t) {
        benchmark::DoNotOptimize(data);
      };
      while (running) driver.pass(mjpeg ? ignore : record, mjpeg ? record : ignore);
    });
    audio = std::thread([&] {
      while (running) {
        if (const u8 *blocks = driver.audio())
          for (std::size_t input = 0; input < 4; ++input) append(files[16 + input], blocks + 48 * input, 48);
        usleep(100);
      }
    });
  };
  const double cost = cpu_of_new_threads(start, [&] { wait_for_the_end(frames, mjpeg); });
  running = false;
  video.join();
  audio.join();
  driver.stop();
  for (const int file : files) close(file);
  return cost;
}

/// Writes sixteen files, one for each channel, with `frames` frames of the supply in total, and with the
/// stream headers that the SDK puts in front.
void write_streams(const fs::path &folder, std::uint64_t frames, bool mjpeg, const Program &program) {
  program(folder, frames, mjpeg, false);
  int number = 0;
  for (const auto &entry : fs::recursive_directory_iterator(folder)) {
    if (entry.path().extension() != ".rec") continue;
    std::ifstream in(entry.path(), std::ios::binary);
    std::ofstream out(folder / ("in" + std::to_string(number++) + (mjpeg ? ".mjpeg" : ".m4v")),
                      std::ios::binary);
    in.seekg(32);
    out << in.rdbuf();
  }
}

double ffmpeg_ns(std::uint64_t frames, bool mjpeg, bool paced, const Program &program) {
  const Folder folder;
  write_streams(folder.path(), frames, mjpeg, program);
  const std::string suffix = mjpeg ? ".mjpeg" : ".m4v";
  std::vector<std::string> words{"ffmpeg", "-nostdin", "-v", "error", "-y"};
  for (int i = 0; i < 16; ++i) {
    if (paced) words.emplace_back("-re");
    for (const char *word : {"-framerate", "30", "-f", mjpeg ? "mjpeg" : "m4v", "-i"})
      words.emplace_back(word);
    words.push_back(folder.path() / ("in" + std::to_string(i) + suffix));
  }
  for (int i = 0; i < 16; ++i) {
    for (const std::string &word :
         {std::string("-map"), std::to_string(i), std::string("-c"), std::string("copy")})
      words.push_back(word);
    words.push_back(folder.path() / ("out" + std::to_string(i) + suffix));
  }
  return run_program(words).cpu_ns;
}

double recorded_ns(std::uint64_t frames, bool mjpeg, bool paced, const Program &program) {
  const Folder folder;
  return program(folder.path(), frames, mjpeg, paced);
}

/// Cost a frame, start and stop taken away.
template <typename Run>
double per_frame(std::uint64_t frames, Run run) {
  const double short_run = run(frames);
  const double long_run = run(3 * frames);
  return (long_run - short_run) / static_cast<double>(2 * frames);
}

}  // namespace

Supply supply_of(std::uint64_t frames, bool paced) {
  Supply supply = streams();
  supply.limit = frames;
  supply.video_rate = paced ? kVideoRate : 0;
  supply.audio_rate = kAudioRate;
  return supply;
}

void wait_for_the_end(std::uint64_t frames, bool mjpeg) {
  for (;;) {
    const virtual_card::Counters counters = virtual_card::counters();
    if ((mjpeg ? counters.mjpeg : counters.mpeg4).delivered >= frames) return;
    std::this_thread::sleep_for(std::chrono::milliseconds(2));
  }
}

std::set<std::string> threads() {
  std::set<std::string> ids;
  for (const auto &entry : fs::directory_iterator("/proc/self/task")) ids.insert(entry.path().filename());
  return ids;
}

void compare_with_bare_calls(const std::string &name, double limit, bool mjpeg, const Program &program) {
  constexpr std::uint64_t kFrames = 4800;
  compare(
      name, 7, limit,
      [&] {
        return per_frame(kFrames, [&](std::uint64_t n) { return recorded_ns(n, mjpeg, false, program); });
      },
      [&] { return per_frame(kFrames, [&](std::uint64_t n) { return bare_ns(n, mjpeg); }); });
}

void compare_with_ffmpeg(const std::string &name, double limit, std::uint64_t frames, bool mjpeg, bool paced,
                         const Program &program) {
  std::vector<double> pauses;
  const auto ours = [&] {
    std::vector<double> paused;
    const double cost = per_frame(frames, [&](std::uint64_t n) {
      const double before = paused_ns;
      const double run = recorded_ns(n, mjpeg, paced, program);
      paused.push_back(paused_ns - before);
      return run;
    });
    pauses.push_back((paused[1] - paused[0]) / static_cast<double>(2 * frames));
    return cost - pauses.back();
  };
  const auto theirs = [&] {
    return per_frame(frames, [&](std::uint64_t n) { return ffmpeg_ns(n, mjpeg, paced, program); });
  };
  const Costs costs = compare(name + ", pauses taken off", 3, limit, ours, theirs);
  note("  the pauses of the capture threads", median(pauses), "ns");
  note("  the ratio with them", (costs.ours + median(pauses)) / costs.theirs, "x");
}

}  // namespace bench

// The pause of a pass, and what it costs. Of the two clock readings, one is not in the difference.
extern "C" int usleep(useconds_t microseconds) {
  static const double reading = [] {
    constexpr int kReadings = 1000;
    const double start = bench::thread_cpu_ns();
    for (int n = 0; n < kReadings; ++n) bench::thread_cpu_ns();
    return (bench::thread_cpu_ns() - start) / kReadings;
  }();
  const double before = bench::thread_cpu_ns();
  const timespec pause{static_cast<time_t>(microseconds / 1000000),
                       static_cast<long>(microseconds % 1000000) * 1000};
  const int status = nanosleep(&pause, nullptr);
  bench::paused_ns += bench::thread_cpu_ns() - before + reading;
  return status;
}
