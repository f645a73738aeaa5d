/**
 * @file options.h
 * The command line of zarvo_export.
 */
#ifndef EXPORT_OPTIONS_H
#define EXPORT_OPTIONS_H

#include <string>
#include <vector>

#include "wall_time.h"

namespace clips {

struct Options {
  std::string root;
  unsigned channel = 0;  ///< from 1; 0: none chosen
  unsigned audio = 0;    ///< the same for the audio input
  Stretch range;
  bool motion = false;
  bool two_fields = false;
  bool check = false;
  bool force = false;
  std::vector<std::string> files;  ///< recordings; none if they are looked up below the root
  std::string output;              ///< the clip

  bool list = false;
  bool json = false;
  std::string svg;
};

/// Throws UsageError.
Options parse_options(int argc, char **argv);

}  // namespace clips

#endif
