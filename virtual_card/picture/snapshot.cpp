// Writes a picture as a PPM file.
#include "snapshot.h"

#include <new>

#include "av_ptr.h"

extern "C" {
#include <libswscale/swscale.h>
}

namespace virtual_card {

std::string to_ppm(const Picture &picture) {
  const auto width = static_cast<int>(picture.width);
  const auto lines = static_cast<int>(picture.lines);
  const AvPtr<SwsContext> scaler(sws_getContext(width, lines, AV_PIX_FMT_YUV422P, width, lines,
                                                AV_PIX_FMT_RGB24, SWS_ACCURATE_RND, nullptr, nullptr,
                                                nullptr));
  if (!scaler) throw std::bad_alloc();
  std::string file = "P6 " + std::to_string(width) + " " + std::to_string(lines) + " 255\n";
  const std::size_t head = file.size();
  file.resize(head + std::size_t{picture.width} * picture.lines * 3);
  const u8 *const planes[] = {picture.y.data(), picture.cb.data(), picture.cr.data()};
  const int strides[] = {width, width / 2, width / 2};
  u8 *const rgb[] = {reinterpret_cast<u8 *>(file.data()) + head};
  const int rgb_strides[] = {width * 3};
  sws_scale(scaler.get(), planes, strides, 0, lines, rgb, rgb_strides);
  return file;
}

}  // namespace virtual_card
