/**
 * @file options.h
 * The command line of zarvo_check.
 */
#ifndef CONTRACT_OPTIONS_H
#define CONTRACT_OPTIONS_H

#include <string>
#include <vector>

namespace contract {

struct Options {
  std::vector<std::string> only, skip;
  bool list = false, quick = false, json = false, watchdog = false;
  unsigned seconds = 10;
};

/// Throws UsageError.
Options parse_options(int argc, char **argv);

}  // namespace contract

#endif
