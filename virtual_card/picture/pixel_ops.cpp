// The inner loops over rows of samples.
#include "pixel_ops.h"

#include <algorithm>
#include <cstdlib>

namespace virtual_card {

void halve_row(const u8 *__restrict in, u8 *__restrict out, std::size_t count) {
  for (std::size_t i = 0; i < count; ++i) out[i] = static_cast<u8>((in[2 * i] + in[2 * i + 1] + 1) >> 1);
}

void average_rows(const u8 *__restrict a, const u8 *__restrict b, u8 *__restrict out, std::size_t count) {
  for (std::size_t i = 0; i < count; ++i) out[i] = static_cast<u8>((a[i] + b[i] + 1) >> 1);
}

void blend_rows(const u8 *__restrict a, const u8 *__restrict b, unsigned weight, u8 *__restrict out,
                std::size_t count) {
  const auto second = static_cast<u16>(weight);
  const auto first = static_cast<u16>(256 - weight);
  for (std::size_t i = 0; i < count; ++i) {
    out[i] = static_cast<u8>(static_cast<u16>(a[i] * first + b[i] * second) >> 8);
  }
}

void resample_row(const u8 *__restrict in, const Tap *__restrict taps, u8 *__restrict out,
                  std::size_t count) {
  for (std::size_t i = 0; i < count; ++i) {
    const Tap tap = taps[i];
    out[i] = static_cast<u8>((in[tap.first] * (256 - tap.weight) + in[tap.second] * tap.weight) >> 8);
  }
}

void pack_uyvy(const u8 *__restrict y, const u8 *__restrict cb, const u8 *__restrict cr, u8 *__restrict out,
               std::size_t pairs) {
  for (std::size_t i = 0; i < pairs; ++i) {
    out[4 * i] = cb[i];
    out[4 * i + 1] = y[2 * i];
    out[4 * i + 2] = cr[i];
    out[4 * i + 3] = y[2 * i + 1];
  }
}

void add_differences(const u8 *__restrict a, const u8 *__restrict b, u32 *__restrict sums,
                     std::size_t blocks) {
  for (std::size_t block = 0; block < blocks; ++block) {
    u32 sum = 0;
    for (std::size_t i = 0; i < 16; ++i) {
      sum += static_cast<u32>(std::abs(a[16 * block + i] - b[16 * block + i]));
    }
    sums[block] += sum;
  }
}

void map_samples(u8 *samples, const std::array<u8, 256> &map, std::size_t count) {
  for (std::size_t i = 0; i < count; ++i) samples[i] = map[samples[i]];
}

void turn_chroma(u8 *__restrict cb, u8 *__restrict cr, int cosine, int sine, std::size_t count) {
  for (std::size_t i = 0; i < count; ++i) {
    const int u = cb[i] - 128;
    const int v = cr[i] - 128;
    cb[i] = static_cast<u8>(std::clamp(128 + ((u * cosine - v * sine + 128) >> 8), 1, 254));
    cr[i] = static_cast<u8>(std::clamp(128 + ((u * sine + v * cosine + 128) >> 8), 1, 254));
  }
}

}  // namespace virtual_card
