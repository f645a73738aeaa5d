/**
 * @file jpeg_encoder.h
 * Baseline JPEG without its headers, which the host puts in front: quality 25, 4:2:0, default
 * Huffman tables.
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

  /// The entropy-coded scan and its EOI; empty when encoding failed. The tables being fixed, `fine`
  /// false saves bytes by leaving fine detail out.
  std::vector<u8> encode(const EncodedPicture &picture, bool fine);

 private:
  struct Compressor;
  std::unique_ptr<Compressor> compressor_;
};

/// Whether the quality register asks for all detail.
bool fine_quality(u32 quality_word);

}  // namespace virtual_card

#endif
