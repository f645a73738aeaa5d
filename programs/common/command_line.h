/**
 * @file command_line.h
 * What the command lines of all programs and examples have in common.
 */
#ifndef COMMAND_LINE_H
#define COMMAND_LINE_H

#include <getopt.h>

#include <map>
#include <stdexcept>
#include <string>
#include <vector>

#include "zv_type.h"

/// Thrown for a wrong command line; what() says what is wrong and what is possible.
struct UsageError : std::runtime_error {
  using std::runtime_error::runtime_error;
};

/// The last rows of every table of options.
#define COMMON_OPTIONS                                                           \
  {"help", no_argument, nullptr, 'h'}, {"version", no_argument, nullptr, 'V'}, { \
    nullptr, 0, nullptr, 0                                                       \
  }

/// Returns the letter of the next option, or -1 when no option follows; optarg and optind are as
/// getopt_long() leaves them. With `words`, takes the arguments between and behind the options there. For
/// --help, -h and --version prints a text and ends the program. Throws UsageError.
int next_option(int argc, char **argv, const option *options, const char *help,
                std::vector<std::string> *words = nullptr);

/// Throws a UsageError that names the possible options.
[[noreturn]] void refuse_option(const std::string &argument, const option *options);

/// The following functions convert the argument of an option, named as the user writes it ("--seconds"). All
/// throw UsageError.
unsigned parse_number(const std::string &option, const std::string &text, unsigned lowest, unsigned highest);

/// Converts a list such as "1,3,5-8" to a mask with bit 0 for number 1.
u32 parse_list(const std::string &option, const std::string &text, unsigned highest);

template <typename Value>
Value parse_name(const std::string &option, const std::string &text,
                 const std::map<std::string, Value> &values) {
  if (const auto found = values.find(text); found != values.end()) return found->second;
  std::string possible;
  for (const auto &[name, value] : values) possible.append(possible.empty() ? "" : ", ").append(name);
  throw UsageError(option + ": '" + text + "' is unknown; possible are " + possible);
}

/// The names of --scale, --codec and --standard.
extern const std::map<std::string, ZV_SCALE_VALUE> scale_names;
extern const std::map<std::string, ZV_VIDEO_CODEC> codec_names;
extern const std::map<std::string, ZV_VIDEO_STANDARD> standard_names;

/// Returns the mask of the first channels, as many as the card encodes at the full rate of a standard.
u32 channels_within_budget(ZV_SCALE_VALUE scale);

#endif
