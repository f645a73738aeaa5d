/**
 * @file frame_rates.h
 * The frame rates a recording can have, as the labels an operator chooses.
 */
#ifndef RECORDING_FRAME_RATES_H
#define RECORDING_FRAME_RATES_H

#include <string>

#include "recording/header.h"

/// Frames a second, falling; the place in the list is the ZV_INTERVAL_VALUE. A null ends each list.
extern const char *const ntsc_fps_str[];
extern const char *const pal_fps_str[];

namespace recording {

/// The list of a standard.
const char *const *frame_rate_list(ZV_VIDEO_STANDARD standard);

/// The label behind a header's rate, which is cut to a whole number: a rate that is not in the list stands
/// for the first label that is cut to it, as 22 for "22.5". The picture's height tells the standard.
std::string frame_rate_label(const RECORD_FILE_HEADER &header);

}  // namespace recording

#endif
