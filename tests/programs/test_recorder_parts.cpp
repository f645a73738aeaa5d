// Parts of the recorder: buffer, loss of groups, what is missing, options, lock, deletion.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/socket.h>
#include <sys/un.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <memory>
#include <random>
#include <sstream>
#include <thread>
#include <tuple>
#include <vector>

#include "programs/common/command_line.h"
#include "programs/recorder/disk_space.h"
#include "programs/recorder/intake.h"
#include "programs/recorder/service.h"
#include "programs/recorder/shortfall.h"
#include "recorder_test.h"
#include "recording/frame_rates.h"

namespace recorder {
namespace {

namespace fs = std::filesystem;
// Catches: a frame that is torn at the end of the memory, that overtakes another, or that the producer
// overwrites while the consumer reads it.
TEST(RecorderRing, FramesComeOutAsTheyWentIn) {
  auto memory = std::make_unique<std::byte[]>(4096);
  Ring ring({memory.get(), 4096});
  constexpr unsigned kFrames = 20000;
  std::thread producer([&ring] {
    std::mt19937 random(1);
    for (unsigned n = 0; n < kFrames; ++n) {
      const std::vector<u8> data(random() % 1500, static_cast<u8>(n));
      Frame frame{};
      frame.time = n;
      frame.length = static_cast<std::uint32_t>(data.size());
      while (!ring.push(frame, data.data())) std::this_thread::yield();
    }
  });
  std::mt19937 random(1);
  for (unsigned n = 0; n < kFrames;) {
    const Ring::Taken taken = ring.take();
    if (taken.frame == nullptr) {
      ring.release(ring.taken());
      std::this_thread::yield();
      continue;
    }
    ASSERT_EQ(taken.frame->time, n);
    ASSERT_EQ(taken.frame->length, random() % 1500);
    for (unsigned i = 0; i < taken.frame->length; ++i) ASSERT_EQ(taken.frame->data()[i], static_cast<u8>(n));
    if (++n % 3 == 0) ring.release(ring.taken());
  }
  producer.join();
}

// Catches: a buffer that is full one frame too early or too late, and one that stays full.
TEST(RecorderRing, TakesAFrameThatFillsIt) {
  alignas(Frame) std::byte memory[256];
  const std::vector<u8> data(sizeof memory, 7);
  Ring ring(memory);
  Frame frame{};
  for (const auto &[length, fits] :
       {std::pair(sizeof memory - sizeof(Frame), true), std::pair(std::size_t{0}, false),
        std::pair(sizeof memory - sizeof(Frame) + 1, false)}) {
    frame.length = static_cast<std::uint32_t>(length);
    EXPECT_EQ(ring.push(frame, data.data()), fits) << length;
    if (length != 0) continue;
    EXPECT_EQ(ring.used(), sizeof memory);
    EXPECT_EQ(ring.take().frame->length, sizeof memory - sizeof(Frame));
    EXPECT_EQ(ring.take().frame, nullptr);
    ring.release(ring.taken());
    EXPECT_EQ(ring.used(), 0u);
  }
}

// Catches: a file that begins with a frame that is no intra frame, and flags that get mixed up.
TEST(RecorderIntake, KnowsIntraFramesAndFlags) {
  struct Row {
    ZV_VIDEO_CODEC codec;
    unsigned stream;
    std::vector<u8> data;
    i32 flags;
    bool intra;
  };
  std::vector<u8> late(200, 0);
  late[197] = 1, late[198] = 0xB6, late[199] = 0x10;
  for (const Row &row :
       {Row{VIDEO_CODEC_ZV_MPEG4, 0, frame_data(true, 99), ZV_FLAG_MOTION, true},
        {VIDEO_CODEC_ZV_MPEG4, 0, frame_data(false, 99), ZV_FLAG_VIDEO_LOSS, false},
        {VIDEO_CODEC_ZV_MPEG4, 0, {0, 0, 1, 0xB6, 0x3F}, 0, true},
        {VIDEO_CODEC_ZV_MPEG4, 0, {0, 0, 1, 0xB6, 0xC0}, 0, false},
        {VIDEO_CODEC_ZV_MPEG4, 0, {0, 0, 1, 0xB6}, 0, false},
        {VIDEO_CODEC_ZV_MPEG4, 0, {}, 0, false},
        {VIDEO_CODEC_ZV_MPEG4, 0, late, 0, false},
        {VIDEO_CODEC_ZV_MPEG4, ZV_CHANNELS, {1, 2, 3}, 0, true},
        {VIDEO_CODEC_ZV_MJPEG, 0, {0xFF, 0xD8}, ZV_FLAG_MOTION | ZV_FLAG_VIDEO_LOSS, true}}) {
    Options options;
    options.channels = 1;
    options.codec = row.codec;
    options.buffer = 1 << 20;
    Intake intake(options);
    intake.take(row.stream, row.data.data(), static_cast<i32>(row.data.size()), row.flags);
    intake.take(1, row.data.data(), 0, 0);  // a channel that is not recorded
    const Frame *const frame = (row.stream == 0 ? intake.video() : intake.audio()).take().frame;
    ASSERT_NE(frame, nullptr);
    EXPECT_EQ(frame->intra, row.intra) << testing::PrintToString(row.data);
    EXPECT_EQ(frame->motion, (row.flags & ZV_FLAG_MOTION) != 0);
    EXPECT_EQ(frame->no_signal, (row.flags & ZV_FLAG_VIDEO_LOSS) != 0);
    EXPECT_EQ(intake.video().take().frame, nullptr);
  }
}

// Catches: a gap that is told too early at a low rate, one that is never told, and a wrong number of frames
// that are due.
TEST(RecorderIntake, SilenceAndFramesDueFollowTheRate) {
  struct Row {
    unsigned rate;
    bool two_fields;
    unsigned limit_ms;
    std::uint64_t due;  ///< in the ten seconds behind the first frame
  };
  for (const Row &row : {Row{0, false, 200, 300}, {0, true, 200, 600}, {14, false, 1668, 12}}) {
    Options options;
    options.channels = 1;
    options.rate = row.rate;
    options.two_fields = row.two_fields;
    options.buffer = 1 << 20;
    Intake intake(options);
    EXPECT_EQ(intake.silence_ms(0, Clock::now()), 0u);
    EXPECT_EQ(intake.expected(0, Clock::now()), 0u);
    intake.take(0, nullptr, 0, 0);
    const Clock::time_point last(Clock::duration(intake.arrivals(0).last));
    EXPECT_EQ(intake.silence_ms(0, last - std::chrono::seconds(1)), 0u);
    EXPECT_EQ(intake.silence_ms(0, last + std::chrono::milliseconds(row.limit_ms)), 0u);
    EXPECT_EQ(intake.silence_ms(0, last + std::chrono::milliseconds(row.limit_ms + 1)), row.limit_ms + 1);
    EXPECT_EQ(intake.expected(0, last + std::chrono::seconds(10)), row.due);
  }
}

// Catches: a slow loss that nobody hears of, and clocks that differ, or frames that come late, taken for a
// loss.
TEST(RecorderShortfall, TellsLossFromDrift) {
  struct Row {
    double missing_share;  ///< of all frames
    unsigned silent_minute, late_minute;
    std::size_t texts;  ///< in three hours
    std::uint64_t missing;
  };
  constexpr double kRate = 30000.0 / 1001;
  constexpr unsigned kNever = 1000;
  for (const Row &row : {Row{0.0002, kNever, kNever, 0, 0},
                         {-0.0002, kNever, kNever, 0, 0},
                         {0.005, kNever, kNever, 3, 1619},
                         {0.02, kNever, kNever, 180, 6474},
                         {0, 70, kNever, 1, 1798},
                         {0.0002, 70, kNever, 1, 1798},
                         {0, kNever, 70, 1, 0}}) {
    Shortfall shortfall;
    std::vector<std::string> texts;
    double frames = 1;
    Shortfall::Counts now;
    for (unsigned minute = 1; minute <= 180; ++minute) {
      frames += minute == row.silent_minute ? 0 : kRate * 60 * (1 - row.missing_share);
      const double late = minute == row.late_minute ? 900 : 0;
      now = {static_cast<std::uint64_t>(frames - late), static_cast<std::uint64_t>(kRate * 60 * minute) + 1};
      if (const std::string text = shortfall.end_minute(now); !text.empty()) texts.push_back(text);
    }
    EXPECT_EQ(texts.size(), row.texts) << row.missing_share << ": " << testing::PrintToString(texts);
    EXPECT_NEAR(static_cast<double>(shortfall.missing(now)), static_cast<double>(row.missing), 2);
    if (row.silent_minute == 70) {
      EXPECT_EQ(texts.at(0).substr(4), " of 1799 were missing in the last minute");
    } else if (row.texts == 3) {
      EXPECT_THAT(texts.at(1),
                  testing::MatchesRegex("5[34][0-9] of 10789[0-9] were missing in the last hour"));
    }
  }
}

// Catches: an option that sets another, a default that does not follow the others, and a choice that the card
// refuses only when it records.
TEST(RecorderOptions, AreTakenOrRefusedWithALine) {
  const auto parse = [](const std::string &text) {
    std::vector<std::string> words{"zarvo_recorder"};
    std::istringstream stream(text);
    for (std::string word; stream >> word;) words.push_back(word);
    std::vector<char *> arguments(words.size() + 1);
    std::ranges::transform(words, arguments.begin(), [](std::string &word) { return word.data(); });
    optind = 0;
    return parse_options(static_cast<int>(words.size()), arguments.data());
  };
  const Options plain = parse("--root /rec///");
  EXPECT_EQ(plain.root, "/rec");
  EXPECT_EQ(std::tuple(plain.channels, plain.audio, plain.gop), std::tuple(0xFFFFu, 0xFu, 30u));
  const Options fields = parse("--two-fields --root / --standard pal --scale half-d1 --audio none");
  EXPECT_EQ(std::tuple(fields.root, fields.channels, fields.audio, fields.gop),
            std::tuple("/", 0xFu, 0u, 50u));
  EXPECT_EQ(stream_rate(fields, 3), 50);
  EXPECT_EQ(std::pair(parse("--root r --rate 15").gop, parse("--root r --rate 1.2").gop), std::pair(15u, 1u));
  const Options many =
      parse("--root r --rate 7.5 --bps 1M --buffer 2 --sync 9 --when-full delete-oldest --gop 7");
  EXPECT_EQ(recording::frame_rate_list(many.standard)[many.rate], std::string("7.5"));
  EXPECT_EQ(std::tuple(many.bit_rate, many.buffer, many.sync.count(), many.delete_oldest, many.gop),
            std::tuple(1 << 20, 2u << 20, 9, true, 7u));
  for (const auto &[words, reason] : std::vector<std::pair<std::string, std::string>>{
           {"--quiet", "--root DIR is missing"},
           {"--root " + std::string(220, 'r'), "at most 219 bytes"},
           {"--root r --two-fields --channels 1-9",
            "at most 8 channels of this --scale with two fields, not 9"},
           {"--root r --two-fields --channels 1-5 --scale half-d1", "at most 4 channels"},
           {"--root r --two-fields --rate 15", "only at the full --rate"},
           {"--root r --scale d1 --two-fields", "--scale d1"},
           {"--root r --rate 29", "'29' is unknown"}}) {
    try {
      parse(words);
      ADD_FAILURE() << words;
    } catch (const UsageError &error) {
      EXPECT_THAT(error.what(), testing::HasSubstr(reason));
    }
  }
}

// Catches: a service manager in a container, whose socket has no file, that hears nothing.
TEST(RecorderService, TellsASocketWithoutAFile) {
  const std::string name = "@zarvo_recorder_" + std::to_string(getpid());
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  name.copy(address.sun_path + 0, name.size());
  address.sun_path[0] = '\0';
  const int file = socket(AF_UNIX, SOCK_DGRAM, 0);
  ASSERT_EQ(bind(file, reinterpret_cast<const sockaddr *>(&address),
                 static_cast<socklen_t>(offsetof(sockaddr_un, sun_path) + name.size())),
            0);
  setenv("NOTIFY_SOCKET", name.c_str(), 1);
  notify("READY=1");
  unsetenv("NOTIFY_SOCKET");
  notify("STOPPING=1");
  char text[64] = {};
  EXPECT_EQ(recv(file, text, sizeof text - 1, MSG_DONTWAIT), 7);
  EXPECT_STREQ(text, "READY=1");
  EXPECT_LT(recv(file, text, sizeof text - 1, MSG_DONTWAIT), 0);
  close(file);
}

// Catches: a second recorder where the lock file was deleted under the first.
TEST(RecorderService, LockFileThatWasDeletedIsMadeAnew) {
  char folder[] = "/tmp/zarvo_recorder_XXXXXX";
  const fs::path root = mkdtemp(folder);
  RootLock lock(root);
  EXPECT_THROW(RootLock{root}, std::runtime_error);
  fs::remove(root / ".zarvo-recorder.lock");
  EXPECT_EQ(lock.hold(), 0);
  EXPECT_THROW(RootLock{root}, std::runtime_error);
  fs::remove_all(root);
  EXPECT_EQ(lock.hold(), ENOENT);
}

// Catches: an hour deleted each second while a reader holds the space, and a disk that stays full because
// nothing more is deleted.
TEST(RecorderDiskSpace, WaitsForTheSpaceOfADeletion) {
  const Clock::time_point now = Clock::now();
  DeletionPause pause;
  EXPECT_TRUE(pause.is_over(now, 3));
  pause = {now + std::chrono::seconds(10), 3};
  EXPECT_FALSE(pause.is_over(now + std::chrono::milliseconds(9999), 3));
  EXPECT_FALSE(pause.is_over(now + std::chrono::seconds(1), 2.9));
  EXPECT_TRUE(pause.is_over(now + std::chrono::seconds(1), 3.1));
  EXPECT_TRUE(pause.is_over(now + std::chrono::seconds(10), 2.9));
}

// Catches: a group that goes on behind a lost frame, and a count that misses frames.
TEST(RecorderIntake, FullBufferLosesWholeGroups) {
  Options options;
  options.channels = 0b11;
  options.audio = 0;
  options.buffer = 1 << 20;
  Intake intake(options);
  constexpr std::size_t kSize = 50000;
  constexpr int kGroup = 5;
  int next = 0;
  const auto take = [&](bool room_soon) {
    const std::vector<u8> data = frame_data(next % kGroup == 0, kSize, static_cast<u8>(next));
    intake.take(1, data.data(), kSize, next % 2 ? ZV_FLAG_MOTION : 0);
    ++next;
    if (room_soon) {
      while (intake.video().take().frame != nullptr) continue;
      intake.video().release(intake.video().taken());
    }
  };
  while (next < 27)
    take(false);  // 20 frames fit: the buffer is full behind the intra frame of the fifth group
  const std::uint64_t lost = intake.arrivals(1).lost;
  EXPECT_EQ(27 - lost, 20u);
  take(true);  // the buffer is empty from now on, but this frame and the two behind it have lost their group
  while (next < 32) take(false);
  const Ring::Taken taken = intake.video().take();
  ASSERT_NE(taken.frame, nullptr);
  EXPECT_TRUE(taken.frame->intra);
  EXPECT_EQ(taken.frame->data()[kSize - 1], 30);
  EXPECT_EQ(taken.frame->lost, 10u);
  EXPECT_EQ(intake.arrivals(1).lost, 10u);
  EXPECT_EQ(intake.video().take().frame->lost, 0u);
}

// Catches: a file that is no recording, or an hour that is being recorded, among the deleted ones.
TEST(RecorderDiskSpace, DeletesTheOldestHourAlone) {
  char folder[] = "/tmp/zarvo_recorder_XXXXXX";
  const fs::path root = mkdtemp(folder);
  const auto make = [&root](const std::string &name) {
    fs::create_directories((root / name).parent_path());
    std::ofstream(root / name) << "x";
  };
  for (const char *old : {"Video/20251124/CH01/20251124-23.rec", "Video/20251124/CH01/20251124-23.idx",
                          "Video/20251124/CH16/20251124-23.12.rec", "Audio/20251124/CH04/20251124-23.aud"})
    make(old);
  const std::vector<std::string> others{
      "Video/20251123/CH01/notes.txt",         "Video/20251123/CH01/20251123-10.rec~",
      "Video/20251123/CH01/20251123-10.x.rec", "Audio/20251125/CH01/20251125-00.aud",
      "Video/20251125/CH01/20251125-00.rec",   "Video/keep/CH01/20251101-10.rec",
      "Video/20251101/kept/20251101-10.rec",   ".zarvo-recorder.lock"};
  for (const std::string &other : others) make(other);
  fs::create_directories(root / "Video/20251110/CH01/20251110-10.rec/full");  // cannot be deleted
  EXPECT_EQ(delete_oldest_hour(root, {"20251125-00"}), "20251124-23");
  EXPECT_FALSE(fs::exists(root / "Video/20251124"));
  EXPECT_FALSE(fs::exists(root / "Audio/20251124"));
  EXPECT_EQ(delete_oldest_hour(root, {"20251125-00"}), "");
  for (const std::string &other : others) EXPECT_TRUE(fs::exists(root / other)) << other;
  EXPECT_EQ(delete_oldest_hour(root, {}), "20251125-00");
  fs::remove_all(root);
}

}  // namespace
}  // namespace recorder
