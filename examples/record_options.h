/**
 * @file record_options.h
 * The command line of zarvo_record.
 */
#ifndef RECORD_OPTIONS_H
#define RECORD_OPTIONS_H

#include <filesystem>

#include "zv_type.h"

struct RecordOptions {
  unsigned seconds = 5;  ///< 0: until a signal comes
  u32 channels = 0;      ///< bit n for channel n
  u32 audio = 0;         ///< bit n for audio input n
  ZV_VIDEO_CODEC codec = VIDEO_CODEC_ZV_MPEG4;
  ZV_SCALE_VALUE scale = SCALE_ZV_CIF;
  ZV_VIDEO_STANDARD standard = VIDEO_STANDARD_ZV_NTSC;
  std::filesystem::path output = "recordings";
  bool to_stdout = false;  ///< one video stream goes to standard output, and no file is written
  bool force = false;      ///< overwrite files
};

/// Parses the command line. For --help and --version prints a text and ends the program. Throws UsageError.
RecordOptions parse_options(int argc, char **argv);

#endif
