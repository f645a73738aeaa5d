/**
 * @file video_format.h
 * What a recording's header and index tell of its pictures, and when it began.
 */
#ifndef EXPORT_VIDEO_FORMAT_H
#define EXPORT_VIDEO_FORMAT_H

#include <optional>

#include "catalogue.h"
#include "recording/frame_rates.h"
#include "recording/header.h"
#include "stream_reader.h"

namespace clips {

struct VideoFormat {
  ZV_VIDEO_CODEC codec;
  int width, height;
  recording::FrameRate rate;  ///< of pictures
};

/// `two_fields` counts where no index tells it.
VideoFormat format_of(const StreamReader &reader, const Recording &recording, bool two_fields);
bool same(const VideoFormat &a, const VideoFormat &b);

/// Returns when the first frame of a recording without an index was written, if the time of the file can be
/// that of its last frame. Reads the file.
std::optional<Milliseconds> start_by_file_time(const Recording &recording, bool two_fields);

}  // namespace clips

#endif
