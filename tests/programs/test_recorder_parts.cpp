// Parts of the recorder: buffer, loss of groups, files of a stream, deletion.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/resource.h>

#include <csignal>
#include <filesystem>
#include <fstream>
#include <memory>
#include <random>
#include <thread>
#include <vector>

#include "programs/recorder/disk_space.h"
#include "programs/recorder/intake.h"
#include "programs/recorder/stream_files.h"

namespace recorder {
namespace {

namespace fs = std::filesystem;
using recording::IndexEntry;
using testing::ElementsAre;

constexpr std::int64_t kHourMs = 3600000;
constexpr std::int64_t kTwoOClock = 1764079200000;  // 2025-11-25 14:00 UTC

// An MPEG-4 frame of a size; the byte at its end tells it apart.
std::vector<u8> frame_data(bool intra, std::size_t size, u8 mark = 0) {
  std::vector<u8> data(size, 0x55);
  constexpr u8 kIntra[] = {0,  0,  1,  0x20, 1,  2,  3,  4, 5, 6, 7,    8,   9,
                           10, 11, 12, 13,   14, 15, 16, 0, 0, 1, 0xB6, 0x10};
  constexpr u8 kOther[] = {0, 0, 1, 0xB6, 0x50};
  if (intra)
    std::copy(std::begin(kIntra), std::end(kIntra), data.begin());
  else
    std::copy(std::begin(kOther), std::end(kOther), data.begin());
  data.back() = mark;
  return data;
}

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

class StreamFilesTest : public testing::Test {
 protected:
  StreamFilesTest() {
    setenv("TZ", "UTC", 1);
    tzset();
    char folder[] = "/tmp/zarvo_recorder_XXXXXX";
    options.root = mkdtemp(folder);
    options.audio = 0b1001;
    files = std::make_unique<StreamFiles>(options, 2);
  }
  ~StreamFilesTest() override { fs::remove_all(options.root); }

  // Gives the files a frame of 100 bytes that came at a time.
  void give(std::int64_t time, bool intra, u8 mark, std::uint32_t lost = 0, std::uint32_t gap_ms = 0) {
    const std::vector<u8> data = frame_data(intra, 100, mark);
    Frame frame{};
    frame.time = time;
    frame.length = 100;
    frame.intra = intra;
    frame.motion = !intra;
    frame.lost = lost;
    frame.gap_ms = gap_ms;
    ASSERT_TRUE(ring.push(frame, data.data()));
    files->queue(ring.take());
  }

  std::string path(const std::string &name) const { return options.root + "/Video/20251125/CH03/" + name; }

  // The marks of the frames in a file.
  std::vector<int> marks(const std::string &name) const {
    std::ifstream file(path(name), std::ios::binary);
    const std::string bytes{std::istreambuf_iterator<char>(file), {}};
    std::vector<int> result;
    for (std::size_t end = 32 + 100; end <= bytes.size(); end += 100) result.push_back(bytes[end - 1]);
    EXPECT_EQ((bytes.size() - 32) % 100, 0u);
    return result;
  }

  Options options;
  std::unique_ptr<std::byte[]> memory = std::make_unique<std::byte[]>(1 << 16);
  Ring ring{{memory.get(), 1 << 16}};
  std::unique_ptr<StreamFiles> files;
};

// Catches: a frame that goes to the wrong side of the hour, an hour that is overwritten, by a second start or
// by a clock that goes back, and counts of the index that belong to another group or file.
TEST_F(StreamFilesTest, NewHourBeginsWithItsFirstIntraFrame) {
  give(kTwoOClock - 80, true, 1);
  give(kTwoOClock - 40, false, 2);
  give(kTwoOClock, false, 3);
  EXPECT_EQ(files->write(), 0);
  give(kTwoOClock + 40, true, 4, 7, 250);
  give(kTwoOClock + 80, false, 5);
  give(kTwoOClock - 20, true, 6);  // the clock has gone back
  give(kTwoOClock + 20, true, 7);
  give(kTwoOClock + 60, true, 8);
  EXPECT_EQ(files->write(), 0);
  EXPECT_EQ(files->finish(kTwoOClock + 100), 0);
  EXPECT_THAT(marks("20251125-13.rec"), ElementsAre(1, 2, 3));
  EXPECT_THAT(marks("20251125-14.rec"), ElementsAre(4, 5));
  EXPECT_THAT(marks("20251125-13.1.rec"), ElementsAre(6));
  EXPECT_THAT(marks("20251125-14.1.rec"), ElementsAre(7, 8));

  const std::vector<IndexEntry> old = recording::read_index(path("20251125-13.idx"));
  ASSERT_EQ(old.size(), 3u);
  EXPECT_EQ(to_line(old[0]),
            "{\"event\":\"start\",\"time\":1764079199920,\"offset\":32,\"standard\":\"ntsc\",\"rate\":\"30\","
            "\"fields\":1,"
            "\"audio\":[1,4]}\n");
  EXPECT_EQ(old[1].frames, 0);
  EXPECT_EQ(to_line(old[2]),
            "{\"event\":\"stop\",\"time\":1764079200040,\"offset\":332,\"frames\":3,\"bytes\":300,\"motion\":"
            "2,\"lost\":0}\n");
  std::vector<std::pair<IndexEntry::Kind, std::int64_t>> seen;
  for (const IndexEntry &entry : recording::read_index(path("20251125-14.idx")))
    seen.emplace_back(entry.kind, entry.kind == IndexEntry::Kind::gap ? entry.ms : entry.frames);
  using Kind = IndexEntry::Kind;
  EXPECT_THAT(seen,
              ElementsAre(std::pair(Kind::start, 0), std::pair(Kind::buffer, 7), std::pair(Kind::gap, 250),
                          std::pair(Kind::intra, 0), std::pair(Kind::stop, 2)));

  files = std::make_unique<StreamFiles>(options, 2);  // a second start
  give(kTwoOClock + kHourMs / 2, true, 9);
  EXPECT_EQ(files->write(), 0);
  EXPECT_THAT(marks("20251125-14.2.rec"), ElementsAre(9));
}

// Catches: in autumn, two hours in one file.
TEST_F(StreamFilesTest, RepeatedHourIsAnotherPart) {
  setenv("TZ", "Europe/Berlin", 1);
  tzset();
  constexpr std::int64_t kSummerEnds = 1761440400000;  // 2025-10-26 01:00 UTC, 3:00 becomes 2:00
  for (int n = 0; n < 4; ++n) give(kSummerEnds - kHourMs + n * kHourMs / 2, true, static_cast<u8>(n));
  EXPECT_EQ(files->write(), 0);
  const fs::path folder = options.root + "/Video/20251026/CH03";
  for (const char *name : {"20251026-02.rec", "20251026-02.1.rec"})
    EXPECT_EQ(fs::file_size(folder / name), 232u) << name;
}

// Catches: a torn frame where the disk was full, a frame that is written twice or not at all afterwards, and
// a file that takes no more bytes but is tried for ever.
TEST_F(StreamFilesTest, WriteErrorKeepsWholeFrames) {
  std::signal(SIGXFSZ, SIG_IGN);
  give(kTwoOClock, true, 1);
  give(kTwoOClock + 40, false, 2);
  ASSERT_EQ(files->write(), 0);
  rlimit limit{};
  getrlimit(RLIMIT_FSIZE, &limit);
  const rlim_t before = std::exchange(limit.rlim_cur, 32 + 350);
  setrlimit(RLIMIT_FSIZE, &limit);
  give(kTwoOClock + 80, false, 3);
  give(kTwoOClock + 120, false, 4);
  give(kTwoOClock + 160, false, 5);
  EXPECT_EQ(files->write(), EFBIG);
  give(kTwoOClock + 200, false, 6);
  give(kTwoOClock + 240, true, 7);
  limit.rlim_cur = before;
  setrlimit(RLIMIT_FSIZE, &limit);
  files->note_disk_error(kTwoOClock + 200, EFBIG);
  EXPECT_EQ(files->write(), 0);
  EXPECT_EQ(files->dropped(), 3u);
  EXPECT_THAT(marks("20251125-14.rec"), ElementsAre(1, 2, 3));
  EXPECT_THAT(marks("20251125-14.1.rec"), ElementsAre(7));
  const auto index = recording::read_index(path("20251125-14.1.idx"));
  ASSERT_GE(index.size(), 3u);
  EXPECT_EQ(index[1].error, "File too large");
  EXPECT_EQ(index[2].frames, 3);
}

// Catches: frames that go on to a file that nobody can reach, and a root that the recorder makes anew under a
// mount point that is empty.
TEST_F(StreamFilesTest, VanishedRootIsToldAndComesBack) {
  give(kTwoOClock, true, 1);
  ASSERT_EQ(files->write(), 0);
  ASSERT_EQ(files->check_place(kTwoOClock), 0);
  fs::rename(options.root, options.root + ".away");
  EXPECT_EQ(files->check_place(kTwoOClock), ENOENT);
  EXPECT_EQ(files->check_place(kTwoOClock), 0);  // told once
  give(kTwoOClock + 40, true, 2);
  EXPECT_EQ(files->write(), ENOENT);
  EXPECT_FALSE(fs::exists(options.root));
  fs::rename(options.root + ".away", options.root);
  give(kTwoOClock + 80, false, 3);
  EXPECT_EQ(files->write(), 0);
  EXPECT_THAT(marks("20251125-14.rec"), ElementsAre(1));
  EXPECT_THAT(marks("20251125-14.1.rec"), ElementsAre(2, 3));
}

// Catches: frames that are counted as recorded although their file has been deleted.
TEST_F(StreamFilesTest, FramesForADeletedFileAreCountedAsDropped) {
  give(kTwoOClock, true, 1);
  ASSERT_EQ(files->write(), 0);
  fs::remove(path("20251125-14.rec"));
  EXPECT_EQ(files->check_place(kTwoOClock), ENOENT);
  give(kTwoOClock + 40, false, 2);
  files->drop_until(0);
  EXPECT_EQ(files->dropped(), 1u);
  give(kTwoOClock + 80, true, 3);
  EXPECT_EQ(files->write(), 0);
  EXPECT_THAT(marks("20251125-14.1.rec"), ElementsAre(3));
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
