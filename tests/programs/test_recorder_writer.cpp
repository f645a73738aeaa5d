// The recorder's writer thread, fed as the card feeds it, on a disk that fails.
#include <gmock/gmock.h>
#include <stdlib.h>

#include <filesystem>
#include <fstream>
#include <map>

#include "programs/recorder/writer.h"
#include "recorder_test.h"
#include "recording/tree.h"
#include "support.h"

namespace recorder {
namespace {

namespace fs = std::filesystem;
using testing::HasSubstr;

std::size_t count(const std::string &text, const std::string &what) {
  std::size_t found = 0;
  for (std::size_t at = text.find(what); at != std::string::npos; at = text.find(what, at + 1)) ++found;
  return found;
}

class WriterTest : public testing::Test {
 protected:
  WriterTest() {
    char folder[] = "/tmp/zarvo_recorder_XXXXXX";
    options.root = mkdtemp(folder);
    options.channels = 0b1001;
    options.audio = 0b10;
    options.buffer = 1 << 20;
    options.min_free = 0;
  }
  ~WriterTest() override { fs::remove_all(options.root); }

  void start() {
    lock = std::make_unique<RootLock>(options.root);
    intake = std::make_unique<Intake>(options);
    writer = std::make_unique<Writer>(options, *lock, *intake, messages);
    writer->start();
  }

  // Feeds a group of five frames of each channel and five blocks of the input, when the buffer has room.
  void feed() {
    ASSERT_TRUE(eventually([this] {
      return intake->video().used() < intake->video().capacity() * 3 / 4 &&
             intake->audio().used() < intake->audio().capacity() * 3 / 4;
    }));
    for (int n = 0; n < 5; ++n, ++mark)
      for (const unsigned stream : {0u, 3u, ZV_CHANNELS + 1u}) {
        const std::vector<u8> data = frame_data(n == 0, is_video(stream) ? 1000 + mark % 7 : 48, mark);
        intake->take(stream, data.data(), static_cast<i32>(data.size()), 0);
        given[stream].append(data.begin(), data.end());
      }
  }

  std::string told() {
    testing::internal::CaptureStderr();
    messages.print();
    return text += testing::internal::GetCapturedStderr();
  }

  // What the files of a stream hold, in the order of their parts.
  std::string recorded(unsigned stream) const {
    const std::string folder = "CH0" + std::to_string(stream % ZV_CHANNELS + 1);
    std::map<std::pair<std::string, unsigned>, fs::path> parts;
    for (const auto &entry : fs::recursive_directory_iterator(options.root)) {
      const fs::path &path = entry.path();
      if (path.extension() != (is_video(stream) ? ".rec" : ".aud") || path.parent_path().filename() != folder)
        continue;
      const std::string name = path.filename();
      parts[{name.substr(0, name.find('.')), recording::parse_file_name(name)->part}] = path;
    }
    std::string bytes;
    for (const auto &[part, path] : parts) {
      std::ifstream file(path, std::ios::binary);
      file.seekg(is_video(stream) ? 32 : 0);
      bytes.append(std::istreambuf_iterator<char>(file), {});
    }
    return bytes;
  }

  Options options;
  Messages messages;
  std::unique_ptr<RootLock> lock;
  std::unique_ptr<Intake> intake;
  std::unique_ptr<Writer> writer;
  std::map<unsigned, std::string> given;
  std::string text;
  u8 mark = 0;
};

// Catches: frames that go to another stream's file, or are overwritten in the buffer before they are written,
// and what stays in the buffer at the end.
TEST_F(WriterTest, EachStreamHasItsFrames) {
  start();
  for (int n = 0; n < 300; ++n) feed();
  writer->finish();
  for (const auto &[stream, bytes] : given) EXPECT_EQ(recorded(stream), bytes) << stream_name(stream);
}

// Catches: an error that is told at each try, or for one stream alone; frames that are lost although the root
// comes back in time; an end that does not try again.
TEST_F(WriterTest, RootThatComesBackLosesNothing) {
  start();
  feed();
  ASSERT_TRUE(eventually([this] { return !recorded(3).empty(); }));
  fs::rename(options.root, options.root + ".away");
  ASSERT_TRUE(eventually([&] { return count(told(), "No such file or directory") == 3; })) << text;
  feed();
  ASSERT_TRUE(eventually([&] { return intake->video().used() > 0; }));
  fs::rename(options.root + ".away", options.root);
  feed();
  writer->finish();
  for (const auto &[stream, bytes] : given) EXPECT_EQ(recorded(stream), bytes) << stream_name(stream);
  EXPECT_EQ(writer->dropped(0), 0u);
  EXPECT_EQ(count(told(), "No such file or directory"), 3u) << text;
  EXPECT_EQ(count(text, "goes on in"), 3u) << text;
  EXPECT_THAT(text, HasSubstr("audio input 2: goes on in " + options.root + "/Audio"));
}

// Catches: a buffer that frames for a broken disk fill for ever, and frames that no count tells.
TEST_F(WriterTest, LongErrorDropsOldGroups) {
  start();
  feed();
  ASSERT_TRUE(eventually([this] { return !recorded(3).empty(); }));
  fs::rename(options.root, options.root + ".away");
  ASSERT_TRUE(eventually([this] { return feed(), writer->dropped(0) > 100; }));
  EXPECT_LT(intake->video().used(), intake->video().capacity());
  fs::rename(options.root + ".away", options.root);
  writer->finish();
  const std::string bytes = recorded(0);
  EXPECT_EQ(count(bytes, {"\0\0\1\xB6", 4}) + writer->dropped(0), intake->arrivals(0).frames);
  EXPECT_TRUE(given[0].ends_with(bytes.substr(bytes.size() - 100000)));
  EXPECT_THAT(told(),
              HasSubstr("channel 1: " + std::to_string(writer->dropped(0)) + " could not be written"));
  EXPECT_EQ(count(text, "No such file or directory"), 3u) << text;
}

// Catches: frames that are in no file at the end and in no count.
TEST_F(WriterTest, RootThatStaysAwayIsCounted) {
  start();
  fs::remove_all(options.root);
  feed();
  writer->finish();
  EXPECT_EQ(writer->dropped(0), 5u);
  EXPECT_THAT(told(), testing::AllOf(HasSubstr("channel 4: 5 could not be written and are lost"),
                                     HasSubstr("audio input 2: 5 could not be written and are lost")));
}

// Catches: a full disk that costs the frames that the buffer still holds at the end, a pause that nobody
// hears of, and one that ends because the root is away.
TEST_F(WriterTest, FullDiskPauses) {
  options.min_free = 101;
  start();
  feed();
  ASSERT_TRUE(eventually([this] { return told().find("recording pauses") != std::string::npos; }));
  EXPECT_TRUE(recorded(0).empty());
  fs::rename(options.root, options.root + ".away");
  ASSERT_TRUE(eventually([this] { return writer->free_percent() < 0; }));
  feed();
  fs::rename(options.root + ".away", options.root);
  writer->finish();
  EXPECT_EQ(recorded(3), given[3]);
  EXPECT_THAT(told(), testing::AllOf(HasSubstr("--min-free is 101"), testing::Not(HasSubstr("goes on"))));
}

// Catches: a stream that was silent when the recording ended, and whose file looks as if it had recorded
// until then; frames that found the buffer full at the end, in no line and in no index.
TEST_F(WriterTest, SilenceAtTheEndIsAGap) {
  start();
  feed();
  const std::vector<u8> too_long = frame_data(true, options.buffer);
  intake->take(0, too_long.data(), static_cast<i32>(too_long.size()), 0);
  ASSERT_TRUE(eventually([this] { return intake->silence_ms(0, Clock::now()) > 0; }));
  writer->note_end();
  writer->finish();
  EXPECT_THAT(told(), testing::AllOf(HasSubstr("channel 4: gap of "), HasSubstr("audio input 2: gap of "),
                                     HasSubstr("channel 1: the buffer was full: 1 frames are lost")));
  unsigned indexes = 0, losses = 0;
  for (const auto &entry : fs::recursive_directory_iterator(options.root)) {
    if (entry.path().extension() != ".idx") continue;
    ++indexes;
    const auto index = recording::read_index(entry.path());
    losses += index.at(index.size() - 3).kind == recording::IndexEntry::Kind::buffer ? 1 : 0;
    const recording::IndexEntry &gap = index.at(index.size() - 2);
    EXPECT_EQ(gap.kind, recording::IndexEntry::Kind::gap);
    EXPECT_GE(gap.ms, 200);
    EXPECT_EQ(index.back().kind, recording::IndexEntry::Kind::stop);
    EXPECT_EQ(index.back().time, gap.time);
  }
  EXPECT_EQ(std::pair(indexes, losses), std::pair(3u, 1u));
}

}  // namespace
}  // namespace recorder
