/**
 * @file command_line.h
 * What the command lines of all examples have in common.
 */
#ifndef COMMAND_LINE_H
#define COMMAND_LINE_H

#include <getopt.h>

#include <stdexcept>
#include <string>

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
/// getopt_long() leaves them. For --help, -h and --version prints a text and ends the program. Throws
/// UsageError.
int next_option(int argc, char **argv, const option *options, const char *help);

/// Throws a UsageError that names the possible options.
[[noreturn]] void refuse_option(const std::string &argument, const option *options);

#endif
