/**
 * @file pixel_ops.h
 * The inner loops over rows of samples. They stand in one file, which is built for speed whatever
 * the rest is built for.
 */
#ifndef VIRTUAL_CARD_PIXEL_OPS_H
#define VIRTUAL_CARD_PIXEL_OPS_H

#include <array>
#include <cstddef>

#include "zv_type.h"

namespace virtual_card {

/// Means of pairs: `count` samples out of 2 x count.
void halve_row(const u8 *in, u8 *out, std::size_t count);
/// Means of two rows.
void average_rows(const u8 *a, const u8 *b, u8 *out, std::size_t count);
/// (a * (256 - weight) + b * weight) / 256, weight below 256.
void blend_rows(const u8 *a, const u8 *b, unsigned weight, u8 *out, std::size_t count);

/// Where an output sample lies between two input samples.
struct Tap {
  u16 first;
  u16 second;
  u16 weight;  ///< of the second, in 256ths
};
void resample_row(const u8 *in, const Tap *taps, u8 *out, std::size_t count);

/// Packs `pairs` pixel pairs as UYVY.
void pack_uyvy(const u8 *y, const u8 *cb, const u8 *cr, u8 *out, std::size_t pairs);

/// Sums of absolute differences of `blocks` runs of 16 samples, added to `sums`.
void add_differences(const u8 *a, const u8 *b, u32 *sums, std::size_t blocks);

void map_samples(u8 *samples, const std::array<u8, 256> &map, std::size_t count);
/// Rotates and scales chroma around 128; the factors are in 256ths.
void turn_chroma(u8 *cb, u8 *cr, int cosine, int sine, std::size_t count);

}  // namespace virtual_card

#endif
