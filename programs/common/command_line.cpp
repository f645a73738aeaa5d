// Parses what the command lines of all programs and examples have in common.
#include "command_line.h"

#include <charconv>
#include <cstdio>
#include <cstdlib>

void refuse_option(const std::string &argument, const option *options) {
  std::string possible;
  for (const option *row = options; row->name; ++row) {
    possible.append(possible.empty() ? "--" : ", --").append(row->name);
  }
  throw UsageError("'" + argument + "' is not an option; possible are " + possible);
}

int next_option(int argc, char **argv, const option *options, const char *help,
                std::vector<std::string> *words) {
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
    case -1:
      if (words == nullptr || optind == argc) return letter;
      words->emplace_back(argv[optind++]);
      return next_option(argc, argv, options, help, words);
    default:
      return letter;
  }
}

unsigned parse_number(const std::string &option, const std::string &text, unsigned lowest, unsigned highest) {
  unsigned number = 0;
  const char *const text_end = text.data() + text.size();
  const auto [end, error] = std::from_chars(text.data(), text_end, number);
  if (error != std::errc{} || end != text_end || number < lowest || number > highest) {
    throw UsageError(option + ": '" + text + "' is not a number from " + std::to_string(lowest) + " to " +
                     std::to_string(highest));
  }
  return number;
}

u32 parse_list(const std::string &option, const std::string &text, unsigned highest) {
  u32 mask = 0;
  for (std::size_t at = 0, comma = 0; comma != std::string::npos; at = comma + 1) {
    comma = text.find(',', at);
    const std::string item = text.substr(at, comma == std::string::npos ? comma : comma - at);
    const std::size_t dash = item.find('-');
    const unsigned first = parse_number(option, item.substr(0, dash), 1, highest);
    const unsigned last =
        dash == std::string::npos ? first : parse_number(option, item.substr(dash + 1), 1, highest);
    if (last < first) {
      throw UsageError(std::string(option).append(": the range '").append(item).append("' runs backwards"));
    }
    for (unsigned number = first; number <= last; ++number) mask |= 1u << (number - 1);
  }
  return mask;
}

const std::map<std::string, ZV_SCALE_VALUE> scale_names = {
    {"cif", SCALE_ZV_CIF}, {"half-d1", SCALE_ZV_HALF_D1}, {"d1", SCALE_ZV_D1}};
const std::map<std::string, ZV_VIDEO_CODEC> codec_names = {{"mpeg4", VIDEO_CODEC_ZV_MPEG4},
                                                           {"mjpeg", VIDEO_CODEC_ZV_MJPEG}};
const std::map<std::string, ZV_VIDEO_STANDARD> standard_names = {{"ntsc", VIDEO_STANDARD_ZV_NTSC},
                                                                 {"pal", VIDEO_STANDARD_ZV_PAL}};

u32 channels_within_budget(ZV_SCALE_VALUE scale) {
  switch (scale) {
    case SCALE_ZV_D1:
      return 0xF;
    case SCALE_ZV_HALF_D1:
      return 0xFF;
    default:
      return 0xFFFF;
  }
}
