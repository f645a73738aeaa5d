// The command line of zarvo_check.
#include "options.h"

#include "programs/common/command_line.h"

namespace contract {
namespace {

constexpr const char *kUsage = R"(Usage: zarvo_check [OPTION...]

Tests whether the card of this machine and its driver behave as the SDK expects, and examines the pictures.
Prints TAP 14. In the end the card has the settings that it had before.

  --list           lists the checks and what each proves
  --only GLOB      runs these checks only, e.g. 'mpeg4.*'; may be given more than once
  --skip GLOB      leaves these checks out; may be given more than once
  --quick          runs the quick checks only: less than a minute
  --seconds N      how long the load checks run: 1 to 3600 seconds (10)
  --watchdog       also runs the checks of the watchdog. A board that does not obey the command to
                   stop its watchdog resets the machine
  --json           prints one JSON document instead of TAP
  -h, --help       shows this text
  --version        shows the version

Exit status: 0 all checks hold or are skipped, 1 some do not hold, 2 wrong use or cannot run.
)";

}  // namespace

Options parse_options(int argc, char **argv) {
  static const option kOptions[] = {
      {"list", no_argument, nullptr, 'l'},          {"only", required_argument, nullptr, 'o'},
      {"skip", required_argument, nullptr, 's'},    {"quick", no_argument, nullptr, 'q'},
      {"seconds", required_argument, nullptr, 'n'}, {"watchdog", no_argument, nullptr, 'w'},
      {"json", no_argument, nullptr, 'j'},          COMMON_OPTIONS};
  Options options;
  std::vector<std::string> words;
  for (int letter; (letter = next_option(argc, argv, kOptions, kUsage, &words)) != -1;) {
    switch (letter) {
      case 'l':
        options.list = true;
        break;
      case 'o':
        options.only.emplace_back(optarg);
        break;
      case 's':
        options.skip.emplace_back(optarg);
        break;
      case 'q':
        options.quick = true;
        break;
      case 'n':
        options.seconds = parse_number("--seconds", optarg, 1, 3600);
        break;
      case 'w':
        options.watchdog = true;
        break;
      case 'j':
        options.json = true;
        break;
    }
  }
  if (!words.empty()) refuse_option(words.front(), kOptions);
  return options;
}

}  // namespace contract
