// What a frame costs from the card's read to the file: sixteen CIF channels and four audio inputs of
// ready-made frames through the SDK and the dialog's callbacks, against a bare loop of the same driver calls
// with one write() a chunk, and against a stream copy by ffmpeg. Every figure is the difference between a
// long and a short run, so that start and stop do not count.
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <QApplication>
#include <array>
#include <atomic>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <set>
#include <string>
#include <thread>

#include "app_state.h"
#include "demodialog.h"
#include "measure.h"
#include "report.h"
#include "zv_lib.h"

extern char **environ;

namespace {

using virtual_card::Supply;
namespace fs = std::filesystem;

std::atomic<int> hours_ahead{0};
std::atomic<double> paused_ns{0};  // processor time of this process's usleep() calls

constexpr double kVideoRate = 480;
constexpr double kAudioRate = 62.5;

/// A folder of its own for the recordings and streams, gone at the end.
class Folder {
 public:
  Folder() {
    char name[] = "/tmp/zarvo-bench-XXXXXX";
    if (mkdtemp(name) == nullptr) std::abort();
    path_ = name;
  }
  ~Folder() { fs::remove_all(path_); }
  const fs::path &path() const { return path_; }

 private:
  fs::path path_;
};

const Supply &streams() {
  static const Supply supply = bench::encoded_supply(60);
  return supply;
}

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

void wait_for_the_end(std::uint64_t frames, bool mjpeg) {
  for (;;) {
    const virtual_card::Counters counters = virtual_card::counters();
    if ((mjpeg ? counters.mjpeg : counters.mpeg4).delivered >= frames) return;
    std::this_thread::sleep_for(std::chrono::milliseconds(2));
  }
}

Supply supply_of(std::uint64_t frames, bool paced) {
  Supply supply = streams();
  supply.limit = frames;
  supply.video_rate = paced ? kVideoRate : 0;
  supply.audio_rate = kAudioRate;
  return supply;
}

std::set<std::string> threads() {
  std::set<std::string> ids;
  for (const auto &entry : fs::directory_iterator("/proc/self/task")) ids.insert(entry.path().filename());
  return ids;
}

/// Processor time of the threads that `start` brings up, when `wait` returns: the host's side of the capture,
/// without the card's own threads.
template <typename Start, typename Wait>
double cpu_of_new_threads(Start start, Wait wait) {
  const std::set<std::string> before = threads();
  start();
  const std::set<std::string> now = threads();
  wait();
  double sum = 0;
  for (const std::string &id : now) {
    double ns = 0;
    if (before.count(id) == 0 && std::ifstream("/proc/self/task/" + id + "/schedstat") >> ns) sum += ns;
  }
  return sum;
}

double recorded_ns(std::uint64_t frames, bool mjpeg, bool paced) {
  const Folder folder;
  virtual_card::reset();
  virtual_card::set_supply(supply_of(frames, paced));
  Recording recording(folder.path(), mjpeg);
  const double cost =
      cpu_of_new_threads([&] { recording.dialog().StartRecord(); }, [&] { wait_for_the_end(frames, mjpeg); });
  recording.dialog().StopRecord();
  return cost;
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
  bench::BareDriver driver;
  std::atomic<bool> running{true};
  std::thread video;
  std::thread audio;
  const auto start = [&] {
    driver.start();
    video = std::thread([&] {
      const bench::BareDriver::Sink record = [&](u32 channel, const u8 *data, std::size_t length) {
        append(files[channel], data, length);
      };
      const bench::BareDriver::Sink ignore = [](u32, const u8 *data, std::size_t) {
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

/// Writes `frames` frames of the supply, all channels together, as sixteen files with the header the SDK
/// would have put in front.
void write_streams(const fs::path &folder, std::uint64_t frames, bool mjpeg) {
  virtual_card::reset();
  virtual_card::set_supply(supply_of(frames, false));
  Recording recording(folder, mjpeg);
  recording.dialog().StartRecord();
  wait_for_the_end(frames, mjpeg);
  recording.dialog().StopRecord();
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

double ffmpeg_ns(std::uint64_t frames, bool mjpeg, bool paced) {
  const Folder folder;
  write_streams(folder.path(), frames, mjpeg);
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
  std::vector<char *> arguments;
  arguments.reserve(words.size() + 1);
  for (std::string &word : words) arguments.push_back(word.data());
  arguments.push_back(nullptr);
  rusage before{};
  getrusage(RUSAGE_CHILDREN, &before);
  pid_t child = 0;
  int status = -1;
  if (posix_spawnp(&child, "ffmpeg", nullptr, nullptr, arguments.data(), environ) != 0) std::abort();
  waitpid(child, &status, 0);
  rusage after{};
  getrusage(RUSAGE_CHILDREN, &after);
  const auto ns = [](const rusage &usage) {
    return static_cast<double>(usage.ru_utime.tv_sec + usage.ru_stime.tv_sec) * 1e9 +
           static_cast<double>(usage.ru_utime.tv_usec + usage.ru_stime.tv_usec) * 1e3;
  };
  return ns(after) - ns(before);
}

/// Cost a frame, start and stop taken away.
template <typename Run>
double per_frame(std::uint64_t frames, Run run) {
  const double short_run = run(frames);
  const double long_run = run(3 * frames);
  return (long_run - short_run) / static_cast<double>(2 * frames);
}

/// Compares the program's own recording with a stream copy by ffmpeg. Entering and leaving the prescribed
/// pauses of the capture threads depends on the machine more than on the program, so the ratio with a limit
/// leaves it out.
void compare_with_ffmpeg(const std::string &name, double limit, std::uint64_t frames, bool mjpeg,
                         bool paced) {
  std::vector<double> pauses;
  const auto ours = [&] {
    std::vector<double> paused;
    const double cost = per_frame(frames, [&](std::uint64_t n) {
      const double before = paused_ns;
      const double run = recorded_ns(n, mjpeg, paced);
      paused.push_back(paused_ns - before);
      return run;
    });
    pauses.push_back((paused[1] - paused[0]) / static_cast<double>(2 * frames));
    return cost - pauses.back();
  };
  const auto theirs = [&] {
    return per_frame(frames, [&](std::uint64_t n) { return ffmpeg_ns(n, mjpeg, paced); });
  };
  const bench::Costs costs = bench::compare(name + ", pauses taken off", 3, limit, ours, theirs);
  bench::note("  the pauses of the capture threads", bench::median(pauses), "ns");
  bench::note("  the ratio with them", (costs.ours + bench::median(pauses)) / costs.theirs, "x");
}

void against_bare_calls(benchmark::State &state) {
  for (auto iteration : state) {
    (void)iteration;
    for (const bool mjpeg : {false, true})
      bench::compare(
          std::string("record ") + (mjpeg ? "Motion JPEG" : "MPEG-4") +
              " as fast as given, against bare calls and write()",
          7, 1.15,
          [&] { return per_frame(4800, [&](std::uint64_t n) { return recorded_ns(n, mjpeg, false); }); },
          [&] { return per_frame(4800, [&](std::uint64_t n) { return bare_ns(n, mjpeg); }); });
  }
}
BENCHMARK(against_bare_calls)->Iterations(1)->Unit(benchmark::kSecond);

void against_ffmpeg(benchmark::State &state) {
  for (auto iteration : state) {
    (void)iteration;
    compare_with_ffmpeg("record Motion JPEG as fast as given, against ffmpeg -c copy", 0.75, 4800, true,
                        false);
    compare_with_ffmpeg("record MPEG-4 at 480 frames/s, against ffmpeg -re -c copy", 0.9, 960, false, true);
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
    const Folder folder;
    virtual_card::reset();
    Supply supply = supply_of(~std::uint64_t{0}, true);
    virtual_card::set_supply(supply);
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

// The pause of a pass, and what it costs.
extern "C" int usleep(useconds_t microseconds) {
  const double before = bench::thread_cpu_ns();
  const timespec pause{static_cast<time_t>(microseconds / 1000000),
                       static_cast<long>(microseconds % 1000000) * 1000};
  const int status = nanosleep(&pause, nullptr);
  paused_ns += bench::thread_cpu_ns() - before;
  return status;
}
