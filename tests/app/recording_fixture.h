/**
 * @file recording_fixture.h
 * The dialog in a working directory of its own with a root "./Data", at 14:05 on 3 March 2009, with half
 * the disk free. Each test leaves no file open.
 */
#ifndef RECORDING_FIXTURE_H
#define RECORDING_FIXTURE_H

#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>
#include <set>

#include "dialog_fixture.h"

namespace fs = std::filesystem;

namespace fake_system {
inline std::atomic<time_t> clock_now;  // read by the capture threads too
inline std::atomic<unsigned> slept;
inline unsigned long disk_blocks, disk_free;
inline bool shell_broken;
inline std::function<void()> while_playing;
}  // namespace fake_system

inline std::time_t at(const char *local_time) {
  std::tm fields{};
  strptime(local_time, "%Y-%m-%d %H:%M:%S", &fields);
  fields.tm_isdst = -1;
  return mktime(&fields);
}

inline std::string content_of(const fs::path &path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), {}};
}

class RecordingTest : public DialogTest {
 protected:
  void SetUp() override {
    char folder[] = "/tmp/zarvo_recording_XXXXXX";
    fs::current_path(mkdtemp(folder));
    fs::create_directory("Data");
    fake_system::clock_now = at("2009-03-03 14:05:00");
    fake_system::disk_blocks = 1000;
    fake_system::disk_free = 500;
    fake_system::shell_broken = false;
    fake_system::slept = 0;
    DialogTest::SetUp();
  }
  void TearDown() override {
    if (!g_finish_record) dialog->StopRecord();
    const fs::path folder = fs::current_path();
    for (const auto &descriptor : fs::directory_iterator("/proc/self/fd")) {
      std::error_code gone;
      EXPECT_FALSE(fs::read_symlink(descriptor, gone).string().starts_with(folder.string()));
    }
    DialogTest::TearDown();
    fs::current_path("/");
    fs::remove_all(folder);
  }

  /// Every file below the root.
  static std::set<std::string> files() {
    std::set<std::string> names;
    for (const auto &entry : fs::recursive_directory_iterator(g_filepath)) {
      if (entry.is_regular_file()) names.insert(entry.path());
    }
    return names;
  }

  /// Chooses a quality, records these channels and inputs, and returns what the start printed.
  std::string start(int quality, unsigned channels, unsigned inputs = 0) {
    choose(dialog->comboQualityMode, quality);
    g_record_ch = channels;
    g_audio_ch = inputs;
    return printed_by([&] { dialog->btnRecordStart->click(); });
  }
};

#endif
