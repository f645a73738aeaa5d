// Parses what the command lines of all examples have in common.
#include "command_line.h"

#include <cstdio>
#include <cstdlib>

void refuse_option(const std::string &argument, const option *options) {
  std::string possible;
  for (const option *row = options; row->name; ++row) {
    possible.append(possible.empty() ? "--" : ", --").append(row->name);
  }
  throw UsageError("'" + argument + "' is not an option; possible are " + possible);
}

int next_option(int argc, char **argv, const option *options, const char *help) {
  opterr = 0;
  const char *const argument = argv[optind];
  const int letter = getopt_long(argc, argv, "+:h", options, nullptr);
  switch (letter) {
    case 'h':
      std::fputs(help, stdout);
      std::exit(0);
    case 'V':
      std::printf("%s %s\n", program_invocation_short_name, ZARVO_VERSION);
      std::exit(0);
    case ':':
      throw UsageError(std::string(argument) + " requires an argument");
    case '?':
      refuse_option(argument, options);
    default:
      return letter;
  }
}
