/**
 * @file pixel_ops.h
 * The inner loops over rows of samples. This file is always built with optimisation, in every configuration.
 */
#ifndef VIRTUAL_CARD_PIXEL_OPS_H
#define VIRTUAL_CARD_PIXEL_OPS_H

#include <array>
#include <cstddef>

#include "zv_type.h"

namespace virtual_card {

/// Halves a row: each of `count` output samples is the mean of two input samples.
void halve_row(const u8 *in, u8 *out, std::size_t count);
/// Writes the mean of two rows.
void average_rows(const u8 *a, const u8 *b, u8 *out, std::size_t count);
/// Writes (a * (256 - weight) + b * weight) / 256; `weight` is below 256.
void blend_rows(const u8 *a, const u8 *b, unsigned weight, u8 *out, std::size_t count);

/// The two input samples of an output sample, and their mixture.
struct Tap {
  u16 first;
  u16 second;
  u16 weight;  ///< weight of `second`, in 256ths
};
void resample_row(const u8 *in, const Tap *taps, u8 *out, std::size_t count);

/// Packs `pairs` pixel pairs as UYVY.
void pack_uyvy(const u8 *y, const u8 *cb, const u8 *cr, u8 *out, std::size_t pairs);

/// Adds to each of `blocks` sums the absolute differences of 16 samples.
void add_differences(const u8 *a, const u8 *b, u32 *sums, std::size_t blocks);

void map_samples(u8 *samples, const std::array<u8, 256> &map, std::size_t count);
/// Rotates and scales chroma around 128. `cosine` and `sine` are in 256ths.
void turn_chroma(u8 *cb, u8 *cr, int cosine, int sine, std::size_t count);

}  // namespace virtual_card

#endif
