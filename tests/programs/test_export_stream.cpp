// How zarvo_export splits files into frames: correct files, torn files, and files in which blocks of the disk
// are missing.
#include <gmock/gmock.h>

#include <cstdio>
#include <fstream>

#include "programs/export/stream_reader.h"

namespace clips {
namespace {

using namespace std::string_literals;

const std::string intra = "\0\0\1\0\0\0\1\x20head\0\0\1\xB6intra"s;  // 21 bytes
const std::string frame = "\0\0\1\xB6other"s;                        // 9 bytes
const std::string jpeg = "\xFF\xD8\xFF\xDB\0\4ab\xFF\xDA\0\3cdata\xFF\0more\xFF\xD0\xFF\xD9"s;

/// Returns a text for each group: the sizes of its frames, "-" and how many are lost, "." for the last group.
std::string groups_of(const char *codec, const std::string &stream) {
  const std::string path = testing::TempDir() + "export_stream.rec";
  std::ofstream(path, std::ios::binary) << codec << std::string(28, '\0') << stream;
  StreamReader reader(path);
  std::string text;
  std::size_t bytes = 0;
  for (Group group; reader.next(group);) {
    for (const std::size_t size : group.sizes) text += std::to_string(size) + " ";
    text += group.lost > 0 ? "-" + std::to_string(group.lost) : "";
    text += group.last ? "." : "|";
    bytes += group.data.size();
  }
  EXPECT_EQ(bytes, stream.size());  // no byte is passed over or comes twice
  std::remove(path.c_str());
  return text;
}

TEST(ExportStream, FramesAreSplitWhereTheyBegin) {
  const std::string zeros(40, '\0');
  const std::string big(700000, 'x');  // more than one read
  const struct {
    const char *codec;
    std::string stream, groups;
  } rows[] = {
      {"MPG4", intra + frame + frame + intra + frame, "21 9 9 |21 9 ."},
      {"MPG4", intra + big + frame + big + intra, "700021 700009 |21 ."},
      {"MPG4", std::string(262140, 'x') + intra + frame, "|21 9 ."},    // an intra frame across two reads
      {"MPG4", frame + "junk" + intra + frame, "|21 9 ."},              // begins in the middle
      {"MPG4", intra + frame + frame + zeros + intra, "21 9 -1|21 ."},  // a block of the disk is missing
      {"MPG4", intra + frame + zeros + frame + intra, "21 -2|21 ."},    // the frame behind needs it
      {"MPG4", intra + frame + "\0\0\1\xC5xx"s + frame + intra, "21 -2|21 ."},  // no start code of the card
      {"MPG4", intra.substr(0, 12) + intra, "-1|21 ."},  // a header without its picture
      {"MPG4", intra + frame + "\0\0\1"s, "21 12 ."},
      {"MPG4", zeros, "."},
      {"MJPG", jpeg + jpeg, "27 |27 ."},
      {"MJPG", jpeg + jpeg.substr(0, 20), "27 |-1."},                // torn
      {"MJPG", jpeg + jpeg.substr(0, 18) + jpeg, "27 |-1|27 ."},     // torn in the middle
      {"MJPG", jpeg.substr(0, 14) + "\xFF\xC0"s + jpeg, "-1|27 ."},  // a marker in the data
      {"MJPG", "junk" + jpeg, "|27 ."},
  };
  for (const auto &row : rows)
    EXPECT_EQ(groups_of(row.codec, row.stream), row.groups)
        << testing::PrintToString(row.stream.substr(0, 80));
  EXPECT_THROW(groups_of("RIFF", intra), RecordingError);
}

}  // namespace
}  // namespace clips
