// The recorder's files of a stream: hours, parts, errors, the root.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/resource.h>

#include <csignal>
#include <filesystem>
#include <fstream>
#include <memory>
#include <vector>

#include "programs/recorder/stream_files.h"
#include "recorder_test.h"
#include "support.h"

namespace fs = std::filesystem;

static std::string broken_file;  // its name; a sync of it fails

extern "C" int fdatasync(int file) {
  if (fs::read_symlink("/proc/self/fd/" + std::to_string(file)).filename() != broken_file) return fsync(file);
  errno = EIO;
  return -1;
}

namespace recorder {
namespace {

using recording::IndexEntry;
using testing::ElementsAre;

constexpr std::int64_t kHourMs = 3600000;
constexpr std::int64_t kTwoOClock = 1764079200000;  // 2025-11-25 14:00 UTC

class StreamFilesTest : public testing::Test {
 protected:
  StreamFilesTest() {
    setenv("TZ", "UTC", 1);
    tzset();
    char folder[] = "/tmp/zarvo_recorder_XXXXXX";
    options.root = mkdtemp(folder);
    options.audio = 0b1001;
    lock = std::make_unique<RootLock>(options.root);
    files = std::make_unique<StreamFiles>(options, *lock, 2);
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

  // The lines of an index as "kind time".
  std::vector<std::string> index(const std::string &name) const {
    constexpr const char *kKinds[] = {"intra", "start", "stop", "gap", "buffer", "disk"};
    std::vector<std::string> lines;
    for (const IndexEntry &entry : recording::read_index(path(name)))
      lines.push_back(kKinds[static_cast<int>(entry.kind)] + (" " + std::to_string(entry.time - kTwoOClock)));
    return lines;
  }

  Options options;
  std::unique_ptr<RootLock> lock;
  std::unique_ptr<std::byte[]> memory = std::make_unique<std::byte[]>(1 << 17);
  Ring ring{{memory.get(), 1 << 17}};
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
  EXPECT_TRUE(files->finish(kTwoOClock + 100, 0, 0).empty());
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
            "{\"event\":\"stop\",\"time\":1764079200033,\"offset\":332,\"frames\":3,\"bytes\":300,\"motion\":"
            "2,\"lost\":0}\n");
  std::vector<std::pair<IndexEntry::Kind, std::int64_t>> seen;
  for (const IndexEntry &entry : recording::read_index(path("20251125-14.idx")))
    seen.emplace_back(entry.kind, entry.kind == IndexEntry::Kind::gap ? entry.ms : entry.frames);
  using Kind = IndexEntry::Kind;
  EXPECT_THAT(seen,
              ElementsAre(std::pair(Kind::start, 0), std::pair(Kind::buffer, 7), std::pair(Kind::gap, 250),
                          std::pair(Kind::intra, 0), std::pair(Kind::stop, 2)));

  files = std::make_unique<StreamFiles>(options, *lock, 2);  // a second start
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
  ASSERT_EQ(files->check_place(), 0);
  fs::rename(options.root, options.root + ".away");
  EXPECT_EQ(files->check_place(), ENOENT);
  EXPECT_EQ(files->check_place(), 0);  // told once
  give(kTwoOClock + 40, true, 2);
  EXPECT_EQ(files->write(), ENOENT);
  EXPECT_FALSE(fs::exists(options.root));
  fs::rename(options.root + ".away", options.root);
  give(kTwoOClock + 80, false, 3);
  EXPECT_EQ(files->write(), 0);
  EXPECT_THAT(marks("20251125-14.rec"), ElementsAre(1));
  EXPECT_THAT(marks("20251125-14.1.rec"), ElementsAre(2, 3));
}

// Catches: frames that are counted as recorded although their file has been deleted, and a file that begins
// in the middle of a group.
TEST_F(StreamFilesTest, FramesForADeletedFileAreCountedAsDropped) {
  give(kTwoOClock, true, 1);
  ASSERT_EQ(files->write(), 0);
  fs::remove(path("20251125-14.rec"));
  EXPECT_EQ(files->check_place(), ENOENT);
  give(kTwoOClock + 40, false, 2);
  EXPECT_EQ(files->write(), 0);
  give(kTwoOClock + 80, false, 3);
  EXPECT_EQ(files->dropped(), 2u);
  give(kTwoOClock + 120, true, 4);
  EXPECT_EQ(files->write(), 0);
  EXPECT_THAT(marks("20251125-14.1.rec"), ElementsAre(4));
}

// Catches: a sync error that is told of another file, or makes another file end, and one that is told twice.
TEST_F(StreamFilesTest, SyncErrorNamesItsFile) {
  give(kTwoOClock - 40, true, 1);
  for (const bool is_open : {false, true}) {
    give(kTwoOClock, true, 2);
    ASSERT_EQ(files->write(), 0);
    broken_file = is_open ? "20251125-14.rec" : "20251125-13.rec";
    const std::vector<Unsynced> failed = files->sync();
    ASSERT_EQ(failed.size(), 1u);
    EXPECT_EQ(std::tuple(failed[0].path, failed[0].error, failed[0].is_open),
              std::tuple(path(broken_file), EIO, is_open));
    EXPECT_TRUE(files->sync().empty());
  }
  broken_file.clear();
  give(kTwoOClock + 80, true, 3);
  EXPECT_EQ(files->write(), 0);
  EXPECT_THAT(marks("20251125-14.rec"), ElementsAre(2, 2));
  EXPECT_THAT(marks("20251125-14.1.rec"), ElementsAre(3));
}

// Catches: a silence that counts as recorded, in the file in front of it, in the one behind it, or at the
// end.
TEST_F(StreamFilesTest, SilenceIsInNoFile) {
  give(kTwoOClock - 80, true, 1);
  give(kTwoOClock + kHourMs, true, 2, 0, kHourMs + 80);
  EXPECT_EQ(files->write(), 0);
  EXPECT_TRUE(files->finish(kTwoOClock + kHourMs + 5000, 5000, 4).empty());
  EXPECT_THAT(index("20251125-13.idx"), ElementsAre("start -80", "intra -80", "stop -47"));
  EXPECT_THAT(index("20251125-15.idx"), ElementsAre("start 3600000", "gap 3600000", "intra 3600000",
                                                    "buffer 3600033", "gap 3605000", "stop 3605000"));
  EXPECT_EQ(recording::read_index(path("20251125-15.idx"))[3].frames, 4);
  EXPECT_EQ(recording::read_index(path("20251125-15.idx"))[4].ms, 5000);
}

// Catches: a frame that is lost or doubled where a write takes no more frames, or where the hour changes
// among the frames of a write.
TEST_F(StreamFilesTest, ManyFramesAreWrittenInOrder) {
  std::vector<int> before, behind;
  for (int n = 0; n < 700; ++n) {
    give(kTwoOClock + (n - 385) * 40, n % 10 == 0, static_cast<u8>(n % 100));
    (n < 390 ? before : behind).push_back(n % 100);
  }
  EXPECT_EQ(files->write(), 0);
  EXPECT_TRUE(files->all_written());
  EXPECT_EQ(marks("20251125-13.rec"), before);
  EXPECT_EQ(marks("20251125-14.rec"), behind);
  EXPECT_EQ(index("20251125-14.idx").front(), "start 200");
}

// Catches: descriptors that stay open for ever, and an index that is written to a number that is another file
// by then.
TEST_F(StreamFilesTest, AnHourClosesItsFiles) {
  std::ptrdiff_t first = 0;
  for (int hour = 0; hour < 5; ++hour) {
    give(kTwoOClock + hour * kHourMs, true, 1);
    EXPECT_EQ(files->write(), 0);
    EXPECT_TRUE(files->sync().empty());
    if (hour == 0) first = open_files();
  }
  EXPECT_EQ(open_files(), first);
  EXPECT_TRUE(files->finish(kTwoOClock + 5 * kHourMs, 0, 0).empty());
  EXPECT_EQ(open_files(), first - 2);
  EXPECT_THAT(index("20251125-17.idx"), ElementsAre("start 10800000", "intra 10800000", "stop 10800033"));
}

// Catches: a group that goes on behind a frame that was dropped, a group that is dropped although its place
// is behind, and a count that misses frames.
TEST_F(StreamFilesTest, GroupsAreDroppedWhole) {
  give(kTwoOClock, true, 1);
  ASSERT_EQ(files->write(), 0);
  give(kTwoOClock + 40, false, 2);
  const std::uint64_t behind_second = ring.taken();
  give(kTwoOClock + 80, false, 3);
  give(kTwoOClock + 120, true, 4);
  give(kTwoOClock + 160, false, 5);
  files->drop_until(behind_second);
  EXPECT_EQ(files->dropped(), 2u);
  EXPECT_EQ(files->write(), 0);
  files->drop_until(ring.taken());  // nothing waits
  give(kTwoOClock + 200, false, 6);
  files->drop_until(ring.taken());
  give(kTwoOClock + 240, false, 7);
  EXPECT_TRUE(files->all_written());
  give(kTwoOClock + 280, true, 8);
  EXPECT_EQ(files->write(), 0);
  EXPECT_EQ(files->dropped(), 4u);
  EXPECT_THAT(marks("20251125-14.rec"), ElementsAre(1, 4, 5, 8));
  EXPECT_THAT(index("20251125-14.idx"),
              ElementsAre("start 0", "intra 0", "buffer 120", "intra 120", "buffer 280", "intra 280"));
}

// Catches: an index that belongs to another recording, and one of a file that is gone, overwritten.
TEST_F(StreamFilesTest, AnIndexKeepsItsPart) {
  fs::create_directories(path(""));
  std::ofstream(path("20251125-14.idx")) << "old";
  std::ofstream(path("20251125-14.1.rec")) << "old";
  give(kTwoOClock, true, 1);
  EXPECT_EQ(files->write(), 0);
  EXPECT_EQ(fs::file_size(path("20251125-14.idx")), 3u);
  EXPECT_FALSE(fs::exists(path("20251125-14.rec")));
  EXPECT_THAT(marks("20251125-14.2.rec"), ElementsAre(1));
}

// Catches: audio with a header, an index that counts from behind one, and an index in the folder of video.
TEST_F(StreamFilesTest, AudioHasNoHeader) {
  files = std::make_unique<StreamFiles>(options, *lock, ZV_CHANNELS + 3);
  for (int n = 0; n < 100; ++n) give(kTwoOClock - 800 + 16 * n, true, 1);
  EXPECT_EQ(files->write(), 0);
  EXPECT_TRUE(files->finish(kTwoOClock + 800, 0, 0).empty());
  const fs::path folder = options.root + "/Audio/20251125/CH04";
  for (const char *hour : {"20251125-13", "20251125-14"}) {
    const auto lines = recording::read_index(folder / (std::string(hour) + ".idx"));
    ASSERT_EQ(lines.size(), 3u);
    EXPECT_EQ(lines[1].offset, 0);
    EXPECT_EQ(lines[2].offset, 5000);
    EXPECT_EQ(fs::file_size(folder / (std::string(hour) + ".aud")), 5000u);
  }
}

// Catches: a recorder that writes into a new root while another one holds it, and one that does not lock it.
TEST_F(StreamFilesTest, ANewRootIsLockedFirst) {
  give(kTwoOClock, true, 1);
  ASSERT_EQ(files->write(), 0);
  fs::remove_all(options.root);
  fs::create_directory(options.root);
  auto other = std::make_unique<RootLock>(options.root);
  EXPECT_EQ(files->check_place(), ENOENT);
  give(kTwoOClock + 40, true, 2);
  EXPECT_EQ(files->write(), EWOULDBLOCK);
  EXPECT_EQ(error_text(EWOULDBLOCK), "another recorder uses the root");
  EXPECT_FALSE(fs::exists(options.root + "/Video"));
  other.reset();
  EXPECT_EQ(files->write(), 0);
  EXPECT_THAT(marks("20251125-14.rec"), ElementsAre(2));
  EXPECT_THROW(RootLock{options.root}, std::runtime_error);
  EXPECT_EQ(lock->hold(), 0);
}

}  // namespace
}  // namespace recorder
