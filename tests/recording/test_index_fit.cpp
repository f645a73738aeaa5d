// Which part of an index is believed.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

#include "recording/header.h"
#include "recording/index.h"
#include "support.h"

namespace recording {
namespace {

namespace fs = std::filesystem;
using Kind = IndexEntry::Kind;

class IndexFit : public testing::TestWithParam<ZV_VIDEO_CODEC> {
 protected:
  ~IndexFit() override {
    for (const std::string &path : {video_, audio_, index_path(video_)}) fs::remove(path);
  }

  // Writes a recording of groups of these sizes; returns its index.
  std::vector<IndexEntry> record(const std::vector<std::size_t> &groups) const {
    const RECORD_FILE_HEADER header = make_header(GetParam(), {352, 288}, "25", 0);
    std::string content(reinterpret_cast<const char *>(&header), sizeof header);
    std::vector<IndexEntry> index;
    const auto add = [&](Kind kind) {
      index.emplace_back().kind = kind;
      index.back().offset = static_cast<std::int64_t>(content.size());
    };
    add(Kind::start);
    for (const std::size_t size : groups) {
      add(Kind::intra);
      content.append(intra_start(GetParam())).append(size, 'x');
    }
    add(Kind::stop);
    std::ofstream(video_, std::ios::binary) << content;
    return index;
  }
  // How many entries of an index are believed; negative if others are not.
  int believed(const std::string &path, const std::vector<IndexEntry> &index) const {
    std::ofstream file(index_path(path));
    for (const IndexEntry &entry : index) file << to_line(entry);
    file.close();
    const FittingIndex fitting = fitting_index(path);
    const int count = static_cast<int>(fitting.entries.size());
    return fitting.misfit ? -count : count;
  }
  void damage(const IndexEntry &at) const {
    std::fstream file(video_, std::ios::in | std::ios::out | std::ios::binary);
    file.seekp(at.offset).write("\0\0\0\0\0\0\0\0", 8);
  }

  const std::string video_ = testing::TempDir() + "fit" + std::to_string(getpid()) + ".rec";
  const std::string audio_ = fs::path(video_).replace_extension(".aud");
};

// An index has a line for start and stop each, and for each group.
// Catches: an index that is believed though its recording is overwritten or cut off, and one that is not
// though only a block of the disk is lost.
TEST_P(IndexFit, IsBelievedAsFarAsTheRecordingAgrees) {
  const std::vector<std::size_t> groups = {100, 90, 80, 110, 70, 100, 95, 105};
  std::vector<IndexEntry> index = record(groups);
  EXPECT_EQ(believed(video_, index), 10);
  damage(index[5]);
  EXPECT_EQ(believed(video_, index), 10);
  record(groups);
  fs::resize_file(video_, static_cast<std::uintmax_t>(index[7].offset + 20));
  EXPECT_EQ(believed(video_, index), -8);
  record(groups);
  std::ofstream(video_, std::ios::app) << "more";
  EXPECT_EQ(believed(video_, index), -9);
  record({60, 60, 60, 60, 60, 60, 60, 60, 60, 60, 60, 60, 60, 60, 60, 60});
  EXPECT_EQ(believed(video_, index), 0);
  EXPECT_TRUE(fitting_index(video_).misfit);
  EXPECT_EQ(believed(video_, {index[0], index[1]}), 2);  // killed in its first group
  index = record({100});
  record({120});
  EXPECT_EQ(believed(video_, index), 0);
  EXPECT_EQ(believed("missing.rec", index), 3);
  fs::remove("missing.idx");
}

INSTANTIATE_TEST_SUITE_P(Codecs, IndexFit, testing::Values(VIDEO_CODEC_ZV_MPEG4, VIDEO_CODEC_ZV_MJPEG));

// A minute of audio is 180000 bytes.
TEST_P(IndexFit, OfAudioEndsWhereTheFileEnds) {
  std::vector<IndexEntry> index(3);
  index[0].kind = Kind::start;
  index[2].offset = 48000;
  const auto of_size = [&](std::size_t size) {
    std::ofstream(audio_) << std::string(size, 'x');
    return believed(audio_, index);
  };
  const auto before = open_files();
  EXPECT_EQ(of_size(48000 + 180000), 3);  // killed
  EXPECT_EQ(open_files(), before);
  EXPECT_EQ(of_size(48000 + 180048), 0);
  EXPECT_EQ(of_size(47952), 0);
  index[2].kind = Kind::stop;
  EXPECT_EQ(of_size(48000), 3);
  EXPECT_EQ(of_size(48048), 0);
}

}  // namespace
}  // namespace recording
