// Measures pictures.
#include "image.h"

#include <array>
#include <cmath>
#include <cstdlib>
#include <stdexcept>
#include <string>

namespace contract {
namespace {

double mean_of(const std::vector<u8> &plane, u32 stride, Area area) {
  double sum = 0;
  for (u32 y = area.y_start; y < area.y_end; ++y)
    for (u32 x = area.x_start; x < area.x_end; ++x) sum += plane[std::size_t{y} * stride + x];
  const double count = double{1} * (area.x_end - area.x_start) * (area.y_end - area.y_start);
  return count > 0 ? sum / count : 0;
}

std::string size_of(const Image &image) {
  return std::to_string(image.width) + " x " + std::to_string(image.height);
}

Area chroma_area(const Image &image, Area area) {
  const u32 shrink = image.height / image.chroma_height;
  return {area.x_start / 2, area.y_start / shrink, area.x_end / 2, area.y_end / shrink};
}

}  // namespace

Tones tones(const Image &image, Area area) {
  if (image.chroma_height == 0 || area.x_end > image.width || area.y_end > image.height)
    throw std::runtime_error("a picture of " + size_of(image) + " is too small");
  const Area chroma = chroma_area(image, area);
  Tones found{mean_of(image.y, image.width, area), 0, mean_of(image.cb, image.width / 2, chroma),
              mean_of(image.cr, image.width / 2, chroma)};
  double squares = 0;
  for (u32 y = area.y_start; y < area.y_end; ++y)
    for (u32 x = area.x_start; x < area.x_end; ++x) {
      const double apart = image.y[std::size_t{y} * image.width + x] - found.luma;
      squares += apart * apart;
    }
  const double count = double{1} * (area.x_end - area.x_start) * (area.y_end - area.y_start);
  found.deviation = count > 0 ? std::sqrt(squares / count) : 0;
  return found;
}

Image unpacked(const u8 *uyvy, u32 width, u32 height) {
  Image image{width, height, height, {}, {}, {}};
  const std::size_t pixels = std::size_t{width} * height;
  image.y.reserve(pixels);
  for (std::size_t pair = 0; pair < pixels / 2; ++pair) {
    const u8 *const bytes = uyvy + 4 * pair;
    image.cb.push_back(bytes[0]);
    image.y.push_back(bytes[1]);
    image.cr.push_back(bytes[2]);
    image.y.push_back(bytes[3]);
  }
  return image;
}

void require_same_size(const Image &one, const Image &other) {
  if (one.width != other.width || one.height != other.height)
    throw std::runtime_error("pictures of " + size_of(one) + " and of " + size_of(other) + " come");
}

std::size_t changed_pixels(const Image &one, const Image &other, int clearly) {
  require_same_size(one, other);
  std::size_t changed = 0;
  for (std::size_t at = 0; at < one.y.size(); ++at)
    changed += std::abs(one.y[at] - other.y[at]) > clearly ? 1 : 0;
  return changed;
}

double difference(const Image &one, Area one_area, const Image &other, Area other_area) {
  constexpr u32 kColumns = 24, kRows = 16;
  const auto cell = [](Area area, u32 column, u32 row) {
    const u32 width = area.x_end - area.x_start, height = area.y_end - area.y_start;
    return Area{area.x_start + width * column / kColumns, area.y_start + height * row / kRows,
                area.x_start + width * (column + 1) / kColumns, area.y_start + height * (row + 1) / kRows};
  };
  double sum = 0;
  for (u32 row = 0; row < kRows; ++row)
    for (u32 column = 0; column < kColumns; ++column) {
      const Tones a = tones(one, cell(one_area, column, row));
      const Tones b = tones(other, cell(other_area, column, row));
      sum += (std::abs(a.luma - b.luma) + std::abs(a.cb - b.cb) + std::abs(a.cr - b.cr)) / 3;
    }
  return sum / (kColumns * kRows);
}

}  // namespace contract
