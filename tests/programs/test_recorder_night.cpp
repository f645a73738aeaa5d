// A night of the recorder on a fast card: every byte a callback was given is in its channel's files, through
// four changes of the hour. ZARVO_LONG_MINUTES of card time (1) are recorded with the card ZARVO_LONG_SPEED
// times as fast as real time (8).
#include <sys/syscall.h>
#include <unistd.h>

#include <atomic>
#include <filesystem>
#include <fstream>
#include <set>

#include "long_recording.h"
#include "programs/recorder/recorder.h"
#include "recording/index.h"

namespace fs = std::filesystem;

namespace {

constexpr int kHours = 4;  // changes of the hour
std::atomic<time_t> ahead{0};

Hashes video, audio;  // of what the callbacks were given; each belongs to one thread of the SDK
ZV_STREAM_CALLBACK video_callback, audio_callback;

void give(Hashes &hashes, ZV_STREAM_CALLBACK callback, u32 channel, u8 *data, i32 length, i32 flags) {
  add(hashes[folder_name(channel)], {reinterpret_cast<const char *>(data), static_cast<std::size_t>(length)});
  callback(channel, data, length, flags);
}

/// Returns the hashes of the files of a kind. The names of a channel's files follow the time.
Hashes hashes_of(const fs::path &folder, std::size_t header) {
  Hashes hashes;
  std::set<fs::path> files;
  for (const auto &entry : fs::recursive_directory_iterator(folder))
    if (entry.is_regular_file() && entry.path().extension() != ".idx") files.insert(entry);
  for (const fs::path &path : files) {
    std::ifstream file(path, std::ios::binary);
    const std::string bytes{std::istreambuf_iterator<char>(file), {}};
    add(hashes[path.parent_path().filename()], std::string_view(bytes).substr(header));
  }
  return hashes;
}

/// Returns the resident memory in MiB.
double resident() {
  double pages = 0, skipped = 0;
  std::ifstream("/proc/self/statm") >> skipped >> pages;
  return pages * static_cast<double>(sysconf(_SC_PAGESIZE)) / (1 << 20);
}

}  // namespace

extern "C" {

// The wall clock, some hours ahead; the card and the monotonic clock do not move.
int clock_gettime(clockid_t clock, timespec *time) noexcept {
  const long status = syscall(SYS_clock_gettime, clock, time);
  if (status == 0 && clock == CLOCK_REALTIME) time->tv_sec += ahead;
  return static_cast<int>(status);
}

int __real_zv_RegisterCallBack(HANDLE, ZV_STREAM_CALLBACK, ZV_STREAM_CALLBACK, ZV_STREAM_CALLBACK);
int __wrap_zv_RegisterCallBack(HANDLE card, ZV_STREAM_CALLBACK mpeg4, ZV_STREAM_CALLBACK mjpeg,
                               ZV_STREAM_CALLBACK blocks) {
  video_callback = mpeg4;
  audio_callback = blocks;
  return __real_zv_RegisterCallBack(
      card,
      [](u32 n, u8 *data, i32 length, i32 flags) { give(video, video_callback, n, data, length, flags); },
      mjpeg,
      [](u32 n, u8 *data, i32 length, i32 flags) { give(audio, audio_callback, n, data, length, flags); });
}
}

TEST(RecorderNight, EveryByteIsInTheFiles) {
  const double seconds = setting("ZARVO_LONG_MINUTES", 1) * 60;
  char folder[] = "/tmp/zarvo_night_XXXXXX";
  recorder::Options options;
  options.root = mkdtemp(folder);
  options.channels = 0xFFFF;
  options.gop = 30;
  virtual_card::reset();
  virtual_card::set_clock(virtual_card::ClockMode::fast, setting("ZARVO_LONG_SPEED", 8));
  virtual_card::set_supply(long_recording_frames());
  {
    recorder::Recorder recording(options);
    recording.start();
    double memory = 0;
    for (int hour = 0; hour <= kHours; ++hour) {
      if (hour == 1) memory = resident();
      ahead = 3600 * hour;
      ASSERT_TRUE(delivered(static_cast<std::uint64_t>(kVideoRate * seconds * (hour + 1) / (kHours + 1))));
    }
    EXPECT_LT(resident() - memory, 8) << "MiB more than after the first hour";
    const virtual_card::Counters counters = virtual_card::counters();
    recording.stop();
    EXPECT_EQ(counters.mpeg4.lost + counters.audio.lost, 0u);
    for (unsigned stream = 0; stream < recorder::kStreams; ++stream) {
      EXPECT_EQ(recording.intake().arrivals(stream).gaps, 0u);
      EXPECT_EQ(recording.intake().arrivals(stream).lost + recording.writer().dropped(stream), 0u);
    }
  }
  EXPECT_EQ(hashes_of(options.root + "/Video", 32), video);
  EXPECT_EQ(hashes_of(options.root + "/Audio", 0), audio);
  unsigned files = 0;
  for (const auto &entry : fs::recursive_directory_iterator(options.root)) {
    if (entry.path().extension() == ".rec" || entry.path().extension() == ".aud") ++files;
    if (entry.path().extension() != ".idx") continue;
    const auto index = recording::read_index(entry.path());
    ASSERT_GE(index.size(), 3u);
    EXPECT_EQ(index.front().kind, recording::IndexEntry::Kind::start);
    EXPECT_EQ(index.back().kind, recording::IndexEntry::Kind::stop);
    for (std::size_t n = 1; n + 1 < index.size(); ++n)
      EXPECT_EQ(index[n].kind, recording::IndexEntry::Kind::intra) << to_line(index[n]);
    const bool is_video = entry.path().string().starts_with(options.root + "/Video");
    const fs::path file = fs::path(entry).replace_extension(is_video ? "rec" : "aud");
    EXPECT_EQ(index.back().offset, static_cast<std::int64_t>(fs::file_size(file)));
  }
  EXPECT_EQ(files, 20u * (kHours + 1));
  fs::remove_all(options.root);
}
