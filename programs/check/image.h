/**
 * @file image.h
 * A picture, and what checks measure in it.
 */
#ifndef CONTRACT_IMAGE_H
#define CONTRACT_IMAGE_H

#include <span>
#include <vector>

#include "zv_type.h"

namespace contract {

struct Area {
  u32 x_start, y_start, x_end, y_end;  ///< the end edges are exclusive
};

/// Luma and chroma of a picture; chroma planes are half as wide.
struct Image {
  u32 width = 0;
  u32 height = 0;
  u32 chroma_height = 0;
  std::vector<u8> y, cb, cr;

  Area all() const { return {0, 0, width, height}; }
  bool empty() const { return y.empty(); }
};

/// Means over an area. The deviation is the standard deviation of the luma. tones() throws std::runtime_error
/// if the area is not in the picture: a card may deliver another size than it should.
struct Tones {
  double luma, deviation, cb, cr;
};
Tones tones(const Image &image, Area area);

/// Unpacks a UYVY picture.
Image unpacked(const u8 *uyvy, u32 width, u32 height);

/// Throws std::runtime_error if two pictures do not have the same size.
void require_same_size(const Image &one, const Image &other);

/// Counts the pixels whose luma differs by more than `clearly` between two pictures of the same size.
std::size_t changed_pixels(const Image &one, const Image &other, int clearly);

/// Returns the mean difference of luma and chroma between two areas, scaled to 24 x 16 samples each.
double difference(const Image &one, Area one_area, const Image &other, Area other_area);

}  // namespace contract

#endif
