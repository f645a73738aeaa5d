#include <cstdio>

#include <jpeglib.h>

#include <map>

#include "sdk_test.h"
#include "stream_headers.h"

namespace {

class Headers : public CardTest {};

/// A header of the wrong size: players show garbage or nothing.
TEST_F(Headers, Mpeg4DescribesThePicture) {
  struct Case {
    u32 standard, resolution;
    ZV_SCALE_VALUE scale;
    Bytes layer;
  };
  const Case cases[] = {
      {0, 0, SCALE_ZV_CIF, {0x0B, 0x04, 0x1E, 0x14}},     {0, 1, SCALE_ZV_CIF, {0x0B, 0x04, 0x1E, 0x14}},
      {1, 1, SCALE_ZV_D1, {0x16, 0x04, 0x48, 0x1C}},      {0, 0, SCALE_ZV_D1, {0x16, 0x84, 0x3C, 0x1C}},
      {1, 0, SCALE_ZV_HALF_D1, {0x16, 0x84, 0x24, 0x14}}, {0, 0, SCALE_ZV_HALF_D1, {0x16, 0x84, 0x1E, 0x14}}};
  for (const Case &test : cases) {
    zv_SetVideoStandard(handle, test.standard);
    zv_SetResolution(handle, test.resolution);
    card().config[11].scale = test.scale;
    ASSERT_EQ(zarvo::make_MP4_header(card(), 11), 0);
    Bytes expected = {0x00, 0x00, 0x01, 0x00, 0x00, 0x00, 0x01, 0x20, 0x02, 0x48, 0x0D, 0x8B, 0xA9, 0x85};
    expected.insert(expected.end(), test.layer.begin(), test.layer.end());
    expected.insert(expected.end(), {0x46, 0x0F});
    EXPECT_EQ(Bytes(zarvo::g_mpeg4_header.begin(), zarvo::g_mpeg4_header.end()), expected);
  }
  card().config[11].scale = SCALE_ZV_NO_ENCODE;
  EXPECT_EQ(zarvo::make_MP4_header(card(), 11), 1);
  card().config[11].scale = SCALE_ZV_INVALID;
  EXPECT_EQ(zarvo::make_MP4_header(card(), 11), 2);
}

/// What a JPEG header says, whichever way it is cut into segments: tables by marker and number.
std::map<int, Bytes> jpeg_tables(const Bytes &jpeg) {
  std::map<int, Bytes> tables;
  for (std::size_t at = 2; at + 4 <= jpeg.size() && jpeg[at] == 0xFF;) {
    const int marker = jpeg[at + 1];
    const std::size_t end = at + 2 + jpeg[at + 2] * 256u + jpeg[at + 3];
    for (std::size_t i = at + 4; i < end;) {
      std::size_t size = end - i;
      if (marker == 0xDB) size = 65;
      if (marker == 0xC4) {
        size = 17;
        for (std::size_t k = 1; k <= 16; ++k) size += jpeg[i + k];
      }
      const bool numbered = marker == 0xDB || marker == 0xC4;
      tables[marker << 8 | (numbered ? jpeg[i] : 0)] =
          Bytes(jpeg.begin() + static_cast<long>(i), jpeg.begin() + static_cast<long>(i + size));
      i += size;
    }
    at = end;
    if (marker == 0xDA) break;
  }
  tables.erase(0xE000);  // the file format's own marker
  return tables;
}

Bytes libjpeg_picture(unsigned width, unsigned height) {
  jpeg_compress_struct encoder;
  jpeg_error_mgr errors;
  encoder.err = jpeg_std_error(&errors);
  jpeg_create_compress(&encoder);
  unsigned char *memory = nullptr;
  unsigned long size = 0;
  jpeg_mem_dest(&encoder, &memory, &size);
  encoder.image_width = width;
  encoder.image_height = height;
  encoder.input_components = 3;
  encoder.in_color_space = JCS_RGB;
  jpeg_set_defaults(&encoder);
  jpeg_set_quality(&encoder, 25, TRUE);
  jpeg_start_compress(&encoder, TRUE);
  Bytes line(width * 3);
  JSAMPROW rows[] = {line.data()};
  while (encoder.next_scanline < height) jpeg_write_scanlines(&encoder, rows, 1);
  jpeg_finish_compress(&encoder);
  jpeg_destroy_compress(&encoder);
  const Bytes picture(memory, memory + size);
  free(memory);
  return picture;
}

/// One wrong byte in 593 spoils every recorded picture: compared with an encoder that has the
/// standard's tables from elsewhere.
TEST_F(Headers, JpegTablesAreTheStandardOnes) {
  zarvo::JpegHeader header = zarvo::jpeg_header_template();
  zarvo::jpeg_set_sof(header, 0x10160, 0xAB0120);  // only the low 16 bits count
  const Bytes bytes(header.begin(), header.end());
  EXPECT_EQ(jpeg_tables(bytes), jpeg_tables(libjpeg_picture(352, 288)));
  const std::map<std::size_t, Bytes> segments = {
      {0, {0xFF, 0xD8, 0xFF, 0xDB, 0x00, 0x43, 0x00, 0x20, 0x16}},
      {71, {0xFF, 0xDB, 0x00, 0x43, 0x01}},
      {140, {0xFF, 0xC4, 0x01, 0xA2, 0x00}},
      {173, {0x10}},
      {352, {0x01}},
      {381, {0x11}},
      {560, {0xFF, 0xC0, 0x00, 0x11, 0x08, 0x01, 0x20, 0x01, 0x60}},
      {579, {0xFF, 0xDA, 0x00, 0x0C}}};
  for (const auto &[offset, expected] : segments) {
    const auto start = bytes.begin() + static_cast<long>(offset);
    EXPECT_EQ(Bytes(start, start + static_cast<long>(expected.size())), expected) << offset;
  }
}

}  // namespace
