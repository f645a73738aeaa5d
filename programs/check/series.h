/**
 * @file series.h
 * What a camera shows under different settings: the evidence of the themes picture and motion.
 */
#ifndef CONTRACT_SERIES_H
#define CONTRACT_SERIES_H

#include "check.h"
#include "image.h"
#include "live.h"

namespace contract {

/// CIF pictures of a camera, and of another one that must not change with it.
struct PictureSeries {
  Image neutral, still, bright, dark, strong, weak, colourful, grey, hue, back, masked, unmasked;
  Image numbered, unnumbered, other_before, other_during;
};

/// What the tags of a camera's frames say.
struct MotionSeries {
  bool moves = false;
  Live::Tags never, always, stopped, excluded, included, other;
  unsigned status_set = 0, status_reads = 0;
};

/// Add the checks of a theme. The first of them that runs takes the series.
void add_picture_series(Checks &checks, const std::function<PictureSeries(Bench &)> &take);
void add_motion_series(Checks &checks, const std::function<MotionSeries(Bench &)> &take);

}  // namespace contract

#endif
