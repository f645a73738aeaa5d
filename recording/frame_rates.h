/**
 * @file frame_rates.h
 * The frame rates of recordings, as the labels that an operator chooses.
 */
#ifndef RECORDING_FRAME_RATES_H
#define RECORDING_FRAME_RATES_H

#include <cstddef>
#include <optional>
#include <string>

#include "recording/header.h"

/// Frames a second, the highest first; the index is the ZV_INTERVAL_VALUE. Each list ends with null.
extern const char *const ntsc_fps_str[];
extern const char *const pal_fps_str[];

namespace recording {

/// Returns the list of a standard.
const char *const *frame_rate_list(ZV_VIDEO_STANDARD standard);

/// Returns the label of a header's rate. A header holds only the whole part of a label: 22 for "22.5". If the
/// number itself is no label, returns the first label with that whole part, or the number if there is none.
/// The picture's height tells the standard.
std::string frame_rate_label(const RECORD_FILE_HEADER &header);

/// Frames a second as a fraction: the labels are rounded.
struct FrameRate {
  int numerator;
  int denominator;
};
/// Returns the exact rate behind the label with this index, of one-field pictures; none behind the end of the
/// list.
std::optional<FrameRate> exact_frame_rate(ZV_VIDEO_STANDARD standard, std::size_t index);

}  // namespace recording

#endif
