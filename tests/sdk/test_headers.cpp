#include <cstdio>

#include <jpeglib.h>

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

/// One wrong byte in 593 spoils every recorded picture: compared with the tables of an encoder that
/// has the standard's from elsewhere.
TEST_F(Headers, JpegTablesAreTheStandardOnes) {
  jpeg_compress_struct encoder;
  jpeg_error_mgr errors;
  encoder.err = jpeg_std_error(&errors);
  jpeg_create_compress(&encoder);
  u8 *tables = nullptr;
  unsigned long size = 0;
  jpeg_mem_dest(&encoder, &tables, &size);
  encoder.input_components = 3;
  encoder.in_color_space = JCS_RGB;
  jpeg_set_defaults(&encoder);
  jpeg_set_quality(&encoder, 25, TRUE);
  jpeg_write_tables(&encoder);
  constexpr std::size_t kHuffman = 2 + 2 * 69;  // behind the start of image and two quantiser tables
  Bytes expected(tables, tables + kHuffman);
  const auto append = [&](const Bytes &more) { expected.insert(expected.end(), more.begin(), more.end()); };
  append({0xFF, 0xC4, 0x01, 0xA2});  // one segment for the four tables
  for (const u8 *segment = tables + kHuffman; segment[1] == 0xC4; segment += 2 + segment[3])
    append(Bytes(segment + 4, segment + 2 + segment[3]));
  jpeg_destroy_compress(&encoder);
  free(tables);
  append({0xFF, 0xC0, 0x00, 0x11, 0x08, 0x01, 0x20, 0x01, 0x60, 0x03, 0x01,
          0x22, 0x00, 0x02, 0x11, 0x01, 0x03, 0x11, 0x01, 0xFF, 0xDA, 0x00,
          0x0C, 0x03, 0x01, 0x00, 0x02, 0x11, 0x03, 0x11, 0x00, 0x3F, 0x00});
  zarvo::JpegHeader header = zarvo::jpeg_header_template();
  zarvo::jpeg_set_sof(header, 0x10160, 0xAB0120);  // only the low 16 bits count
  EXPECT_EQ(Bytes(header.begin(), header.end()), expected);
}

}  // namespace
