// Writes pictures as PNG files.
#include "png_file.h"

#include <png.h>

#include <cstdio>

namespace card {

bool write_png(const std::string &ppm, const std::string &path) {
  png_image image{};
  image.version = PNG_IMAGE_VERSION;
  image.format = PNG_FORMAT_RGB;
  const std::size_t head = ppm.find('\n') + 1;
  if (std::sscanf(ppm.c_str(), "P6 %u %u", &image.width, &image.height) != 2) return false;
  if (ppm.size() - head < PNG_IMAGE_SIZE(image)) return false;
  return png_image_write_to_file(&image, path.c_str(), 0, ppm.data() + head, 0, nullptr) != 0;
}

}  // namespace card
