// Parses the command line of zarvo_record.
#include "record_options.h"

#include <unistd.h>

#include <bit>
#include <optional>
#include <string>

#include "programs/common/command_line.h"

namespace {

constexpr char kHelp[] =
    "Usage: zarvo_record [options]\n"
    "Records channels of the capture card, one elementary stream a file.\n\n"
    "  --seconds N         how long, 1 to 86400; 0: until SIGINT, SIGTERM or SIGHUP (5)\n"
    "  --channels LIST     video channels, e.g. 1-16 or 1,3,5-8\n"
    "                      (as many as the card encodes at the full rate: 16 cif, 8 half-d1 or 4 d1)\n"
    "  --codec NAME        mpeg4 or mjpeg (mpeg4)\n"
    "  --scale NAME        cif, half-d1 or d1 (cif)\n"
    "  --standard NAME     ntsc or pal (ntsc)\n"
    "  --audio LIST        audio inputs, e.g. 1-4, or none (1-4)\n"
    "  --output DIR        where the files go; made when missing (recordings)\n"
    "  --output -          write the stream of one video channel to standard output, all else to\n"
    "                      standard error\n"
    "  --force             overwrite files\n"
    "  -h, --help          this text\n"
    "  --version           the version\n\n"
    "Status: 0 all frames came; 1 failed; 2 wrong option; 3 done, but more than 1 % of a stream is missing\n";

const option kOptions[] = {{"seconds", required_argument, nullptr, 's'},
                           {"channels", required_argument, nullptr, 'c'},
                           {"codec", required_argument, nullptr, 'v'},
                           {"scale", required_argument, nullptr, 'z'},
                           {"standard", required_argument, nullptr, 't'},
                           {"audio", required_argument, nullptr, 'a'},
                           {"output", required_argument, nullptr, 'o'},
                           {"force", no_argument, nullptr, 'f'},
                           COMMON_OPTIONS};

/// Checks that the options select one stream for standard output.
void check_single_stream(const RecordOptions &options) {
  if (!std::has_single_bit(options.channels)) throw UsageError("--output -: choose one channel");
  if (options.audio != 0) throw UsageError("--output -: audio needs a folder");
  if (isatty(STDOUT_FILENO)) throw UsageError("--output -: standard output is a terminal");
}

}  // namespace

RecordOptions parse_options(int argc, char **argv) {
  RecordOptions options;
  std::optional<u32> audio;
  for (int letter; (letter = next_option(argc, argv, kOptions, kHelp)) != -1;) {
    const std::string text = optarg ? optarg : "";
    switch (letter) {
      case 's':
        options.seconds = parse_number("--seconds", text, 0, 86400);
        break;
      case 'c':
        options.channels = parse_list("--channels", text, ZV_CHANNELS);
        break;
      case 'v':
        options.codec = parse_name("--codec", text, codec_names);
        break;
      case 'z':
        options.scale = parse_name("--scale", text, scale_names);
        break;
      case 't':
        options.standard = parse_name("--standard", text, standard_names);
        break;
      case 'a':
        audio = text == "none" ? 0 : parse_list("--audio", text, ZV_AUDIO_CHANNELS);
        break;
      case 'o':
        options.output = text;
        break;
      default:
        options.force = true;
        break;
    }
  }
  if (optind < argc) refuse_option(argv[optind], kOptions);
  if (options.output.empty()) throw UsageError("--output: the name of the folder is empty");
  options.to_stdout = options.output == "-";
  options.audio = audio.value_or(options.to_stdout ? 0 : (1u << ZV_AUDIO_CHANNELS) - 1);
  if (options.channels == 0) options.channels = channels_within_budget(options.scale);
  if (options.to_stdout) check_single_stream(options);
  return options;
}
