// The recorder's index: which lines stand in it, and what they count.
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <sstream>

#include "programs/recorder/index_writer.h"

namespace recorder {
namespace {

using recording::IndexEntry;
using testing::ElementsAre;

class IndexWriterTest : public testing::Test {
 protected:
  ~IndexWriterTest() override { std::remove(path.c_str()); }

  int file() const { return open(path.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0600); }

  // The lines of the index, without what is the same in all: "intra 1000 62" is kind, time, frames or length.
  std::vector<std::string> lines() const {
    std::vector<std::string> lines;
    for (const IndexEntry &entry : recording::read_index(path))
      lines.push_back(std::to_string(static_cast<int>(entry.kind)) + " " + std::to_string(entry.time) + " " +
                      std::to_string(entry.frames + entry.ms));
    return lines;
  }

  const std::string path = testing::TempDir() + "/recorder_" + std::to_string(getpid()) + ".idx";
};

// Catches: an audio index with a line for each block, one that counts blocks twice or not at all, and one
// whose times are wrong for up to a second behind a gap.
TEST_F(IndexWriterTest, AudioHasALineASecondAndBehindAGap) {
  IndexWriter index({}, 16, 62);
  index.begin(file(), 1000, 0);
  Frame block{};
  block.length = 48;
  block.intra = true;
  for (int n = 0; n < 200; ++n) {
    block.time = 1000 + 16 * n;
    block.gap_ms = n == 70 ? 500 : 0;
    index.add_frame(block, 48 * n, n == 135 ? 3 : 0);
  }
  close(index.end(48 * 200));
  EXPECT_THAT(lines(), ElementsAre("1 1000 0", "0 1000 0", "0 1992 62", "3 2120 500", "0 2120 8", "0 3112 62",
                                   "4 3160 3", "0 3160 3", "0 4152 62", "2 4200 3"));
}

// Catches: a line that is torn or lost where the disk takes a part of what is written, and text that grows
// for ever while it takes nothing; an error that is told at each try, or not at all.
TEST_F(IndexWriterTest, KeepsWhatTheDiskDoesNotTake) {
  int ends[2];
  ASSERT_EQ(pipe2(ends, O_NONBLOCK), 0);
  fcntl(ends[1], F_SETPIPE_SZ, 4096);
  IndexWriter index({}, 33, 1);
  index.begin(ends[1], 0, 32);
  Frame frame{};
  frame.intra = true;
  std::string text;
  const auto write_and_read = [&] {
    index.write();
    char buffer[8192];
    const ssize_t size = read(ends[0], buffer, sizeof buffer);
    if (size > 0) text.append(buffer, static_cast<std::size_t>(size));
    return size > 0;
  };
  for (frame.time = 1; frame.time <= 5000; ++frame.time) index.add_frame(frame, 32, 0);
  index.write();
  index.write();
  EXPECT_EQ(index.take_error(), EAGAIN);
  EXPECT_EQ(index.take_error(), 0);
  while (write_and_read()) continue;
  std::istringstream lines(text);
  std::int64_t count = -1;  // without the line "start"
  for (std::string line; std::getline(lines, line); ++count) {
    const auto entry = recording::parse_line(line);
    ASSERT_TRUE(entry) << line;
    ASSERT_EQ(entry->time, count + 1);
  }
  EXPECT_GT(count, 100);
  EXPECT_LT(text.size(), 70000u);
  index.add_frame(frame, 32, 0);
  EXPECT_TRUE(write_and_read());
  EXPECT_TRUE(text.ends_with("\n"));
  close(index.end(32));
  close(ends[0]);
}

// Catches: an error that is told nowhere because its file could not be created, or twice.
TEST_F(IndexWriterTest, ErrorsWithoutAFileAreInTheNext) {
  IndexWriter index({}, 33, 1);
  for (int n = 0; n < 200; ++n) index.add_disk_error(1000 + n, 0, "No such file or directory");
  index.begin(file(), 5000, 32);
  EXPECT_EQ(index.end(32) >= 0, true);
  EXPECT_EQ(lines().size(), 102u);
  EXPECT_EQ(lines()[1], "5 1000 0");
  std::remove(path.c_str());
  index.begin(file(), 6000, 32);
  index.end(32);
  EXPECT_THAT(lines(), ElementsAre("1 6000 0", "2 6000 0"));
}

}  // namespace
}  // namespace recorder
