/**
 * @file qualities.h
 * The picture sizes that comboQualityMode offers, and the number of channels that each allows.
 */
#ifndef QUALITIES_H
#define QUALITIES_H

#include "panel_helpers.h"
#include "zv_type.h"

/// A picture size and its share of the card's encoding budget.
struct Quality {
  ZV_SCALE_VALUE scale;
  int cif_pictures;  ///< size in CIF pictures
};

/// The qualities in the order of the items; "None" is the first item.
inline constexpr Quality kQualities[] = {
    {SCALE_ZV_NO_ENCODE, 0}, {SCALE_ZV_CIF, 1}, {SCALE_ZV_HALF_D1, 2}, {SCALE_ZV_D1, 4}};

/// Returns the quality of an item, or "None" for an index without an item.
inline Quality quality_of(int item) {
  return item_value(kQualities, item, kQualities[0]);
}

/// Returns how many channels the card encodes at the full rate: its budget is sixteen one-field CIF channels.
/// Two fields count twice.
constexpr int allowed_channels(const Quality &quality, ZV_TWOFIELD_MODE fields) {
  if (quality.scale == SCALE_ZV_NO_ENCODE) return 0;
  return static_cast<int>(ZV_CHANNELS) / (quality.cif_pictures * (fields == TWOFIELD_ENABLE ? 2 : 1));
}

#endif
