/**
 * @file options.h
 * The command line of zarvo_recorder.
 */
#ifndef RECORDER_OPTIONS_H
#define RECORDER_OPTIONS_H

#include <chrono>
#include <cstddef>
#include <string>

#include "zv_type.h"

namespace recorder {

struct Options {
  std::string root;
  u32 channels = 0;  ///< masks with bit 0 for number 1
  u32 audio = (1u << ZV_AUDIO_CHANNELS) - 1;
  ZV_VIDEO_CODEC codec = VIDEO_CODEC_ZV_MPEG4;
  ZV_SCALE_VALUE scale = SCALE_ZV_CIF;
  bool two_fields = false;  ///< both fields of each frame are encoded, each as a frame of the stream
  ZV_VIDEO_STANDARD standard = VIDEO_STANDARD_ZV_NTSC;
  ZV_RESOLUTION width = RESOLUTION_ZV_720;
  unsigned rate = 0;  ///< index in the list of frame rates of the standard
  u32 gop = 0;
  u32 qp = 6;
  i32 bit_rate = 0;  ///< bits a second; 0: encode with qp
  double min_free = 5;
  bool delete_oldest = false;
  std::chrono::seconds sync{1};
  std::size_t buffer = std::size_t{64} << 20;  ///< bytes
  bool quiet = false;
};

/// Returns the frames or audio blocks a second of a stream.
double stream_rate(const Options &options, unsigned stream);

/// Throws UsageError.
Options parse_options(int argc, char **argv);

}  // namespace recorder

#endif
