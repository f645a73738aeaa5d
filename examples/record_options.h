/**
 * @file record_options.h
 * The command line of zarvo_record.
 */
#ifndef RECORD_OPTIONS_H
#define RECORD_OPTIONS_H

#include <filesystem>
#include <stdexcept>

#include "zv_type.h"

struct RecordOptions {
  unsigned seconds = 5;
  u32 channels = 0;  ///< bit n for channel n
  u32 audio = 0xF;   ///< bit n for audio input n
  ZV_VIDEO_CODEC codec = VIDEO_CODEC_ZV_MPEG4;
  ZV_SCALE_VALUE scale = SCALE_ZV_CIF;
  ZV_VIDEO_STANDARD standard = VIDEO_STANDARD_ZV_NTSC;
  std::filesystem::path output = "recordings";
};

/// Thrown for a wrong command line; what() says what is wrong and what is possible.
struct UsageError : std::runtime_error {
  using std::runtime_error::runtime_error;
};

/// Parses the command line. For --help prints the help and ends the program. Throws UsageError.
RecordOptions parse_options(int argc, char **argv);

#endif
