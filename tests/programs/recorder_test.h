/**
 * @file recorder_test.h
 * What the tests of the recorder's parts share.
 */
#ifndef RECORDER_TEST_H
#define RECORDER_TEST_H

#include <algorithm>
#include <vector>

#include "zv_type.h"

namespace recorder {

/// An MPEG-4 frame of a size; the byte at its end tells it apart.
inline std::vector<u8> frame_data(bool intra, std::size_t size, u8 mark = 0) {
  std::vector<u8> data(size, 0x55);
  constexpr u8 kIntra[] = {0,  0,  1,  0x20, 1,  2,  3,  4, 5, 6, 7,    8,   9,
                           10, 11, 12, 13,   14, 15, 16, 0, 0, 1, 0xB6, 0x10};
  constexpr u8 kOther[] = {0, 0, 1, 0xB6, 0x50};
  if (intra)
    std::copy(std::begin(kIntra), std::end(kIntra), data.begin());
  else
    std::copy(std::begin(kOther), std::end(kOther), data.begin());
  data.back() = mark;
  return data;
}

}  // namespace recorder

#endif
