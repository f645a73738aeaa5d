// Tests of the MPEG-4 and JPEG headers that the SDK puts in front of what the encoder delivers.

#include "stream_headers.h"

#include <cstdio>

#include <jpeglib.h>

#include "sdk_test.h"

namespace {

using Headers = SdkTest;

/// Catches: a header of the wrong size, with which players show garbage or nothing.
TEST_F(Headers, Mpeg4DescribesThePicture) {
  struct Case {
    u32 standard, resolution;
    ZV_SCALE_VALUE scale;
    u8 width, width_and_height, height, end;  ///< bytes 14 to 17
  };
  for (const auto &[standard, resolution, scale, byte14, byte15, byte16, byte17] :
       {Case{0, 0, SCALE_ZV_CIF, 0x0B, 0x04, 0x1E, 0x14}, Case{0, 1, SCALE_ZV_CIF, 0x0B, 0x04, 0x1E, 0x14},
        Case{1, 1, SCALE_ZV_D1, 0x16, 0x04, 0x48, 0x1C}, Case{0, 0, SCALE_ZV_D1, 0x16, 0x84, 0x3C, 0x1C},
        Case{1, 0, SCALE_ZV_HALF_D1, 0x16, 0x84, 0x24, 0x14},
        Case{0, 0, SCALE_ZV_HALF_D1, 0x16, 0x84, 0x1E, 0x14}}) {
    zv_SetVideoStandard(handle, standard);
    zv_SetResolution(handle, resolution);
    kept().config[11].scale = scale;
    ASSERT_EQ(zarvo::make_MP4_header(kept(), 11), 0);
    EXPECT_THAT(zarvo::g_mpeg4_header,
                ElementsAre(0x00, 0x00, 0x01, 0x00, 0x00, 0x00, 0x01, 0x20, 0x02, 0x48, 0x0D, 0x8B, 0xA9,
                            0x85, byte14, byte15, byte16, byte17, 0x46, 0x0F));
  }
  kept().config[11].scale = SCALE_ZV_NO_ENCODE;
  EXPECT_EQ(zarvo::make_MP4_header(kept(), 11), 1);
  kept().config[11].scale = SCALE_ZV_INVALID;
  EXPECT_EQ(zarvo::make_MP4_header(kept(), 11), 2);
}

/// Catches: one wrong byte in 593, which spoils every picture. An encoder that has the standard's tables from
/// elsewhere writes them, but the Huffman tables in a segment each.
TEST_F(Headers, JpegTablesAreTheStandardOnes) {
  jpeg_compress_struct encoder;
  jpeg_error_mgr errors;
  encoder.err = jpeg_std_error(&errors);
  jpeg_create_compress(&encoder);
  Bytes buffer(4096);
  u8 *tables = buffer.data();
  unsigned long size = buffer.size();
  jpeg_mem_dest(&encoder, &tables, &size);
  encoder.input_components = 3;
  encoder.in_color_space = JCS_RGB;
  jpeg_set_defaults(&encoder);
  jpeg_set_quality(&encoder, 25, TRUE);
  jpeg_write_tables(&encoder);
  jpeg_destroy_compress(&encoder);

  constexpr std::size_t kHuffman = 2 + 2 * 69;  // after the start of image and two quantiser tables
  Bytes expected(tables, tables + kHuffman);
  expected.insert(expected.end(), {0xFF, 0xC4, 0x01, 0xA2});
  for (const u8 *segment = tables + kHuffman; segment[1] == 0xC4; segment += 2 + segment[3])
    expected.insert(expected.end(), segment + 4, segment + 2 + segment[3]);
  expected.insert(expected.end(), {0xFF, 0xC0, 0x00, 0x11, 0x08, 0x01, 0x20, 0x01, 0x60, 0x03, 0x01,
                                   0x22, 0x00, 0x02, 0x11, 0x01, 0x03, 0x11, 0x01, 0xFF, 0xDA, 0x00,
                                   0x0C, 0x03, 0x01, 0x00, 0x02, 0x11, 0x03, 0x11, 0x00, 0x3F, 0x00});
  zarvo::JpegHeader header = zarvo::jpeg_header_template();
  zarvo::jpeg_set_sof(header, 0x10160, 0xAB0120);  // only the low 16 bits count
  EXPECT_THAT(header, testing::ElementsAreArray(expected));
}

}  // namespace
