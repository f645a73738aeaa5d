#include "jpeg_encoder.h"

#include <algorithm>
#include <array>
#include <cstdio>

#include <jerror.h>
#include <jpeglib.h>

#include "pixel_ops.h"

namespace virtual_card {

namespace {

/// The tables of the host's header are those of this quality.
constexpr int kQuality = 25;
constexpr u32 kCoarseWord = 0x02020202;
constexpr u32 kStripLines = 2 * DCTSIZE;

struct Failure {};

[[noreturn]] void fail(j_common_ptr) {
  throw Failure{};
}
void say_nothing(j_common_ptr) {}

/// Where the library puts its bytes.
struct Sink : jpeg_destination_mgr {
  std::vector<u8> bytes;
  std::size_t used = 0;

  Sink() : jpeg_destination_mgr() {
    init_destination = [](j_compress_ptr c) { of(c).offer(65536); };
    empty_output_buffer = [](j_compress_ptr c) -> boolean {
      of(c).used = of(c).bytes.size();
      of(c).offer(of(c).bytes.size() * 2);
      return TRUE;
    };
    term_destination = [](j_compress_ptr c) { of(c).used = of(c).bytes.size() - of(c).free_in_buffer; };
  }
  static Sink &of(j_compress_ptr c) { return *static_cast<Sink *>(c->dest); }
  void offer(std::size_t size) {
    bytes.resize(std::max(size, bytes.size()));
    next_output_byte = bytes.data() + used;
    free_in_buffer = bytes.size() - used;
  }
};

/// Where the scan data begin: behind the SOS segment.
std::size_t scan_start(const std::vector<u8> &bytes, std::size_t size) {
  std::size_t at = 2;
  while (at + 4 <= size && bytes[at] == 0xFF) {
    const bool sos = bytes[at + 1] == 0xDA;
    at += 2 + (std::size_t{bytes[at + 2]} << 8 | bytes[at + 3]);
    if (sos) return at;
  }
  return size;
}

/// Smooths a plane along its lines, and across them within a field.
void smooth_plane(const std::vector<u8> &in, std::vector<u8> &out, u32 width, u32 height, u32 fields) {
  std::vector<u8> row(std::size_t{width} + 2);
  out.resize(in.size());
  for (u32 line = 0; line < height; ++line) {
    const u32 above = line >= fields ? line - fields : line;
    const u32 below = line + fields < height ? line + fields : line;
    smooth_rows(in.data() + std::size_t{above} * width, in.data() + std::size_t{line} * width,
                in.data() + std::size_t{below} * width, row.data() + 1, width);
    row.front() = row[1];
    row.back() = row[width];
    smooth_rows(row.data(), row.data() + 1, row.data() + 2, out.data() + std::size_t{line} * width, width);
  }
}

}  // namespace

struct JpegEncoder::Compressor {
  jpeg_compress_struct jpeg{};
  jpeg_error_mgr errors{};
  Sink sink;

  Compressor() {
    jpeg.err = jpeg_std_error(&errors);
    errors.error_exit = fail;
    errors.output_message = say_nothing;
    jpeg_create_compress(&jpeg);
    jpeg.dest = &sink;
  }
  ~Compressor() { jpeg_destroy_compress(&jpeg); }

  void compress(const EncodedPicture &picture) {
    sink.used = 0;
    jpeg.image_width = picture.size.width;
    jpeg.image_height = picture.size.height;
    jpeg.input_components = 3;
    jpeg.in_color_space = JCS_YCbCr;
    jpeg_set_defaults(&jpeg);
    jpeg_set_quality(&jpeg, kQuality, TRUE);
    jpeg.raw_data_in = TRUE;
    jpeg.dct_method = JDCT_IFAST;
    jpeg_start_compress(&jpeg, TRUE);
    while (jpeg.next_scanline < jpeg.image_height) write_strip(picture);
    jpeg_finish_compress(&jpeg);
  }

  void write_strip(const EncodedPicture &picture) {
    std::array<JSAMPROW, kStripLines> y;
    std::array<JSAMPROW, DCTSIZE> cb, cr;
    const std::size_t width = picture.size.width;
    const std::size_t first = jpeg.next_scanline;
    // The library only reads the rows.
    for (std::size_t i = 0; i < y.size(); ++i)
      y[i] = const_cast<u8 *>(picture.y.data()) + (first + i) * width;
    for (std::size_t i = 0; i < cb.size(); ++i) {
      const std::size_t at = (first / 2 + i) * (width / 2);
      cb[i] = const_cast<u8 *>(picture.cb.data()) + at;
      cr[i] = const_cast<u8 *>(picture.cr.data()) + at;
    }
    std::array<JSAMPARRAY, 3> planes{y.data(), cb.data(), cr.data()};
    jpeg_write_raw_data(&jpeg, planes.data(), kStripLines);
  }
};

JpegEncoder::JpegEncoder() : compressor_(std::make_unique<Compressor>()) {}
JpegEncoder::~JpegEncoder() = default;

std::vector<u8> JpegEncoder::encode(const EncodedPicture &picture, bool fine) {
  const EncodedPicture *source = &picture;
  if (!fine) {
    const EncodedSize size = picture.size;
    const u32 fields = size.interlaced ? 2 : 1;
    smooth_.size = size;
    smooth_plane(picture.y, smooth_.y, size.width, size.height, fields);
    smooth_plane(picture.cb, smooth_.cb, size.width / 2, size.height / 2, fields);
    smooth_plane(picture.cr, smooth_.cr, size.width / 2, size.height / 2, fields);
    source = &smooth_;
  }
  try {
    compressor_->compress(*source);
  } catch (const Failure &) {
    jpeg_abort_compress(&compressor_->jpeg);
    return {};
  }
  const Sink &sink = compressor_->sink;
  const auto begin = sink.bytes.begin();
  return {begin + static_cast<std::ptrdiff_t>(scan_start(sink.bytes, sink.used)),
          begin + static_cast<std::ptrdiff_t>(sink.used)};
}

bool fine_quality(u32 quality_word) {
  return quality_word != kCoarseWord;
}

}  // namespace virtual_card
