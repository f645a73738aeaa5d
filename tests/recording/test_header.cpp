// What a header says about its recording.
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdio>
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

// Catches: the rest of a header that a torn file lacks, taken from memory.
TEST(Header, ATornFileHasNone) {
  const RECORD_FILE_HEADER header = make_header(VIDEO_CODEC_ZV_MPEG4, {352, 240}, "30", 0);
  FILE *const file = std::tmpfile();
  for (const std::size_t size : {std::size_t{0}, std::size_t{1}, sizeof header - 1, sizeof header}) {
    ASSERT_EQ(pwrite(fileno(file), &header, size, 0), static_cast<ssize_t>(size));
    lseek(fileno(file), 0, SEEK_SET);
    EXPECT_EQ(read_header(fileno(file)).has_value(), size == sizeof header) << size;
  }
  std::fclose(file);
}

}  // namespace
}  // namespace recording
