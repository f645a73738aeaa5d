/**
 * @file jpeg_encoder.h
 * Encodes baseline JPEG without the headers, which the host adds: quality 25, 4:2:0, default Huffman tables.
 */
#ifndef VIRTUAL_CARD_JPEG_ENCODER_H
#define VIRTUAL_CARD_JPEG_ENCODER_H

#include <memory>
#include <vector>

#include "encoded_picture.h"

namespace virtual_card {

class JpegEncoder {
 public:
  JpegEncoder();
  ~JpegEncoder();

  /// Returns the scan data with their EOI marker; empty when encoding fails. The tables are fixed, so `fine`
  /// false saves bytes by leaving out fine detail.
  std::vector<u8> encode(const EncodedPicture &picture, bool fine);

 private:
  struct Compressor;
  std::unique_ptr<Compressor> compressor_;
};

/// Returns whether the quality register asks for all detail.
bool fine_quality(u32 quality_word);

}  // namespace virtual_card

#endif
