// The recorder's index: which lines stand in it, and what they count.
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdio>

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
  IndexWriter index({}, 62);
  index.begin(file(), 1000, 0);
  Frame block{};
  block.length = 48;
  block.intra = true;
  for (int n = 0; n < 200; ++n) {
    block.time = 1000 + 16 * n;
    block.gap_ms = n == 70 ? 500 : 0;
    index.add_frame(block, 48 * n, n == 135 ? 3 : 0);
  }
  close(index.end(4200, 48 * 200));
  EXPECT_THAT(lines(), ElementsAre("1 1000 0", "0 1000 0", "0 1992 62", "3 2120 500", "0 2120 8", "0 3112 62",
                                   "4 3160 3", "0 3160 3", "0 4152 62", "2 4200 3"));
}

}  // namespace
}  // namespace recorder
