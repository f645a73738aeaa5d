/**
 * @file qualities.h
 * The items of comboQualityMode.
 */
#ifndef QUALITIES_H
#define QUALITIES_H

#include "panel_helpers.h"
#include "zv_type.h"

/// A picture size, and how many channels the card encodes in it at the full rate with one field and with
/// two. "None" is the first item; D1 has no field mode.
struct Quality {
  ZV_SCALE_VALUE scale;
  int channels[2];
};

inline constexpr Quality kQualities[] = {
    {SCALE_ZV_NO_ENCODE, {0, 0}},
    {SCALE_ZV_CIF, {16, 8}},
    {SCALE_ZV_HALF_D1, {8, 4}},
    {SCALE_ZV_D1, {4, 4}},
};

/// The quality of an item; "None" for an index without one.
inline Quality quality_of(int item) {
  return item_value(kQualities, item, kQualities[0]);
}

#endif
