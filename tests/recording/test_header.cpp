// What a header says about its recording.
#include <gtest/gtest.h>

#include <cstring>

#include "recording/header.h"

namespace recording {
namespace {

// Catches: a label that is read beyond its field when no zero byte ends it; the bytes of the file follow
// there.
TEST(Header, ALabelEndsWithItsField) {
  struct {
    RECORD_FILE_HEADER header;
    char stream[16];
  } file{};
  std::memset(file.stream, 'S', sizeof file.stream);
  file.header = make_header(VIDEO_CODEC_ZV_MPEG4, {352, 240}, "30", 15);
  EXPECT_EQ(label_of(file.header), "Channel 16");
  std::memset(file.header.channel_label, 'L', sizeof file.header.channel_label);
  EXPECT_EQ(label_of(file.header), std::string(16, 'L'));
}

}  // namespace
}  // namespace recording
