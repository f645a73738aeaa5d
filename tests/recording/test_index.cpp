// The index of a recording, written and read.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

#include "recording/index.h"

namespace recording {
namespace {

using Kind = IndexEntry::Kind;

IndexEntry entry_of(Kind kind) {
  IndexEntry entry;
  entry.kind = kind;
  entry.time = 1764082681033;
  entry.offset = 5'000'000'032;
  if (kind == Kind::intra || kind == Kind::stop) entry.bytes = 4711, entry.motion = 3, entry.lost = 2;
  if (kind == Kind::intra || kind == Kind::stop || kind == Kind::buffer) entry.frames = 30;
  if (kind == Kind::start || kind == Kind::standard) entry.standard = "pal";
  if (kind == Kind::start) entry.rate = "22.5", entry.fields = 2, entry.audio = {1, 4};
  if (kind == Kind::gap) entry.ms = 250;
  if (kind == Kind::disk) entry.error = "No space left on \"device\"";
  return entry;
}

// Catches: a key that the writer and the reader name differently, and a line that another program does not
// know.
TEST(Index, LinesComeBackAsTheyWere) {
  for (const Kind kind :
       {Kind::intra, Kind::start, Kind::stop, Kind::gap, Kind::buffer, Kind::disk, Kind::standard})
    EXPECT_EQ(parse_line(to_line(entry_of(kind))), entry_of(kind)) << to_line(entry_of(kind));
  EXPECT_EQ(to_line(entry_of(Kind::intra)),
            "{\"intra\":true,\"time\":1764082681033,\"offset\":5000000032,\"frames\":30,\"bytes\":4711,"
            "\"motion\":3,"
            "\"lost\":2}\n");
  EXPECT_EQ(to_line(entry_of(Kind::start)),
            "{\"event\":\"start\",\"time\":1764082681033,\"offset\":5000000032,\"standard\":\"pal\",\"rate\":"
            "\"22.5\","
            "\"fields\":2,\"audio\":[1,4]}\n");
}

// Catches: a reader that gives up at a torn or strange line, or ends the program there.
TEST(Index, StrangeLinesAreSkipped) {
  const std::string path = testing::TempDir() + "/strange.idx";
  const std::string good = to_line(entry_of(Kind::gap));
  std::ofstream(path) << good
                      << "\n[1]\n\"text\"\n{\"event\":\"later\",\"time\":1,\"offset\":1}\n{\"event\":7}\n"
                      << "{\"intra\":true,\"time\":\"now\",\"offset\":32}\n\xff\xfe\n"
                      << good << to_line(entry_of(Kind::intra)).substr(0, 40);
  EXPECT_EQ(read_index(path), (std::vector{entry_of(Kind::gap), entry_of(Kind::gap)}));
  std::filesystem::remove(path);
  EXPECT_TRUE(read_index(path).empty());
}

TEST(Index, StandsBesideItsRecording) {
  EXPECT_EQ(index_path("/a.rec/20261125-14.1.rec"), "/a.rec/20261125-14.1.idx");
  EXPECT_EQ(index_path("20261125-14.aud"), "20261125-14.idx");
}

}  // namespace
}  // namespace recording
