// Encodes Motion-JPEG pictures with libjpeg.
#include "jpeg_encoder.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <new>

#include <jerror.h>
#include <jpeglib.h>

namespace virtual_card {

namespace {

/// The quality at which libjpeg's tables equal those of the host's header.
constexpr int kQuality = 25;
/// A coarse picture has only coefficients whose sum of horizontal and vertical frequency is below this.
constexpr int kCoarseFrequencies = 4;
constexpr u32 kStripLines = 2 * DCTSIZE;

struct Failure {};

[[noreturn]] void fail(j_common_ptr jpeg) {
  if (jpeg->err->msg_code == JERR_OUT_OF_MEMORY) throw std::bad_alloc();
  throw Failure{};
}
void say_nothing(j_common_ptr) {}

/// The destination of the library's output.
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

/// Returns the offset of the scan data, behind the SOS segment.
std::size_t scan_start(const std::vector<u8> &bytes, std::size_t size) {
  std::size_t at = 2;
  while (at + 4 <= size && bytes[at] == 0xFF) {
    const bool sos = bytes[at + 1] == 0xDA;
    at += 2 + (std::size_t{bytes[at + 2]} << 8 | bytes[at + 3]);
    if (sos) return at;
  }
  return size;
}

/// Removes the fine detail from an 8 x 8 block of coefficients.
void coarsen(JCOEF *block) {
  for (int v = 0; v < DCTSIZE; ++v) {
    for (int u = std::max(0, kCoarseFrequencies - v); u < DCTSIZE; ++u) block[v * DCTSIZE + u] = 0;
  }
}

}  // namespace

struct JpegEncoder::Compressor {
  jpeg_compress_struct jpeg{};
  jpeg_decompress_struct fine_jpeg{};
  std::vector<u8> fine_bytes;
  jpeg_error_mgr errors{};
  Sink sink;

  Compressor() {
    jpeg.err = jpeg_std_error(&errors);
    errors.error_exit = fail;
    errors.output_message = say_nothing;
    fine_jpeg.err = &errors;
  }
  ~Compressor() {
    jpeg_destroy_compress(&jpeg);
    jpeg_destroy_decompress(&fine_jpeg);
  }
  /// Not part of the constructor, so that the destructor frees what exists after a bad_alloc.
  void create() {
    jpeg_create_compress(&jpeg);
    jpeg_create_decompress(&fine_jpeg);
    jpeg.dest = &sink;
  }
  void abort() {
    jpeg_abort_compress(&jpeg);
    jpeg_abort_decompress(&fine_jpeg);
  }

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

  /// Encodes the last picture again, with fewer coefficients and the same tables.
  void coarsen_result() {
    fine_bytes.swap(sink.bytes);
    jpeg_mem_src(&fine_jpeg, fine_bytes.data(), sink.used);
    jpeg_read_header(&fine_jpeg, TRUE);
    jvirt_barray_ptr *const coefficients = jpeg_read_coefficients(&fine_jpeg);
    auto *const common = reinterpret_cast<j_common_ptr>(&fine_jpeg);
    for (int i = 0; i < fine_jpeg.num_components; ++i) {
      const jpeg_component_info &component = fine_jpeg.comp_info[i];
      for (JDIMENSION row = 0; row < component.height_in_blocks; ++row) {
        JBLOCKROW blocks = *fine_jpeg.mem->access_virt_barray(common, coefficients[i], row, 1, TRUE);
        for (JDIMENSION column = 0; column < component.width_in_blocks; ++column) coarsen(blocks[column]);
      }
    }
    sink.used = 0;
    jpeg_copy_critical_parameters(&fine_jpeg, &jpeg);
    jpeg_write_coefficients(&jpeg, coefficients);
    jpeg_finish_compress(&jpeg);
    jpeg_finish_decompress(&fine_jpeg);
  }

  void write_strip(const EncodedPicture &picture) {
    std::array<JSAMPROW, kStripLines> y;
    std::array<JSAMPROW, DCTSIZE> cb, cr;
    const std::size_t width = picture.size.width;
    const std::size_t first = jpeg.next_scanline;
    // The library does not write into the rows, although its type is not const.
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

JpegEncoder::JpegEncoder() : compressor_(std::make_unique<Compressor>()) {
  compressor_->create();
}
JpegEncoder::~JpegEncoder() = default;

std::vector<u8> JpegEncoder::encode(const EncodedPicture &picture, bool fine) {
  try {
    compressor_->compress(picture);
    if (!fine) compressor_->coarsen_result();
  } catch (const Failure &) {
    compressor_->abort();
    return {};
  } catch (const std::bad_alloc &) {
    compressor_->abort();
    throw;
  }
  const Sink &sink = compressor_->sink;
  const auto begin = sink.bytes.begin();
  return {begin + static_cast<std::ptrdiff_t>(scan_start(sink.bytes, sink.used)),
          begin + static_cast<std::ptrdiff_t>(sink.used)};
}

bool fine_quality(u32 quality_word) {
  return quality_word != driver::kMjpegCoarse;
}

}  // namespace virtual_card
