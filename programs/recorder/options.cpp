// Parses the command line of zarvo_recorder.
#include "options.h"

#include <algorithm>
#include <bit>
#include <cmath>

#include "frame.h"
#include "programs/common/command_line.h"
#include "recording/frame_rates.h"
#include "recording/tree.h"

namespace recorder {
namespace {

constexpr char kHelp[] =
    "Usage: zarvo_recorder --root DIR [options]\n"
    "Records channels of the capture card for months: hourly files below DIR, until SIGINT, SIGTERM or "
    "SIGHUP.\n\n"
    "  --root DIR          where the recordings go; an existing folder\n"
    "  --channels LIST     video channels, e.g. 1-16 or 1,3,5-8\n"
    "                      (as many as the card encodes at the full rate: 16 cif, 8 half-d1 or 4 d1)\n"
    "  --audio LIST        audio inputs, e.g. 1-4, or none (1-4)\n"
    "  --codec NAME        mpeg4 or mjpeg (mpeg4)\n"
    "  --scale NAME        cif, half-d1 or d1 (cif)\n"
    "  --two-fields        encode both fields of each frame, twice as many pictures a second;\n"
    "                      at the full rate, 8 cif or 4 half-d1 channels at most\n"
    "  --standard NAME     ntsc or pal (ntsc)\n"
    "  --width PIXELS      720 or 704, of half-d1 and d1 (720)\n"
    "  --rate LABEL        frames a second, e.g. 15 or 7.5 (30; pal: 25)\n"
    "  --gop N             mpeg4: frames from one intra frame to the next, 1 to 300 (one second)\n"
    "  --qp N              mpeg4: quantiser, 1 to 31 (6)\n"
    "  --bps LABEL         mpeg4: constant bit rate instead of --qp: 64k, 128k, 256k, 512k, 1M to 10M\n"
    "  --min-free PERCENT  how much of the disk stays free, 1 to 99 (5)\n"
    "  --when-full NAME    what to do when less is free: stop, or delete-oldest (stop)\n"
    "  --sync SECONDS      how many seconds a power cut may cost, 1 to 3600 (1)\n"
    "  --buffer MIB        memory for what the disk does not take in time, 1 to 4096 (64)\n"
    "  --quiet             no status line each minute\n"
    "  -h, --help          this text\n"
    "  --version           the version\n\n"
    "SIGUSR1 prints a table of all channels.\n"
    "Status: 0 ended by a signal; 1 failed; 2 wrong option; 3 ended by a signal, but frames are lost\n";

const option kOptions[] = {
    {"root", required_argument, nullptr, 'o'},     {"channels", required_argument, nullptr, 'c'},
    {"audio", required_argument, nullptr, 'a'},    {"codec", required_argument, nullptr, 'v'},
    {"scale", required_argument, nullptr, 'z'},    {"two-fields", no_argument, nullptr, 'F'},
    {"standard", required_argument, nullptr, 't'}, {"width", required_argument, nullptr, 'w'},
    {"rate", required_argument, nullptr, 'r'},     {"gop", required_argument, nullptr, 'g'},
    {"qp", required_argument, nullptr, 'q'},       {"bps", required_argument, nullptr, 'b'},
    {"min-free", required_argument, nullptr, 'm'}, {"when-full", required_argument, nullptr, 'f'},
    {"sync", required_argument, nullptr, 's'},     {"buffer", required_argument, nullptr, 'u'},
    {"quiet", no_argument, nullptr, 'Q'},          COMMON_OPTIONS};

constexpr i32 kKilo = 1024;
constexpr i32 kMega = 1048576;
const std::map<std::string, i32> kBitRates = {
    {"64k", 64 * kKilo}, {"128k", 128 * kKilo}, {"256k", 256 * kKilo}, {"512k", 512 * kKilo},
    {"1M", kMega},       {"2M", 2 * kMega},     {"3M", 3 * kMega},     {"4M", 4 * kMega},
    {"5M", 5 * kMega},   {"6M", 6 * kMega},     {"7M", 7 * kMega},     {"8M", 8 * kMega},
    {"9M", 9 * kMega},   {"10M", 10 * kMega}};
const std::map<std::string, ZV_RESOLUTION> kWidths = {{"720", RESOLUTION_ZV_720}, {"704", RESOLUTION_ZV_704}};
const std::map<std::string, bool> kWhenFull = {{"stop", false}, {"delete-oldest", true}};

std::map<std::string, unsigned> rate_names(ZV_VIDEO_STANDARD standard) {
  std::map<std::string, unsigned> names;
  for (auto label = recording::frame_rate_list(standard); *label != nullptr; ++label)
    names.emplace(*label, static_cast<unsigned>(names.size()));
  return names;
}

/// What can be checked only when all options are known.
struct Later {
  std::string rate;
  bool qp = false;
};

/// Takes an option that describes the picture. Returns false if it is another option.
bool take_picture_option(int letter, const std::string &text, Options &options, Later &later) {
  switch (letter) {
    case 'v':
      options.codec = parse_name("--codec", text, codec_names);
      return true;
    case 'z':
      options.scale = parse_name("--scale", text, scale_names);
      return true;
    case 'F':
      options.two_fields = true;
      return true;
    case 't':
      options.standard = parse_name("--standard", text, standard_names);
      return true;
    case 'w':
      options.width = parse_name("--width", text, kWidths);
      return true;
    case 'r':
      later.rate = text;
      return true;
    case 'g':
      options.gop = parse_number("--gop", text, 1, 300);
      return true;
    case 'q':
      options.qp = parse_number("--qp", text, 1, 31);
      later.qp = true;
      return true;
    case 'b':
      options.bit_rate = parse_name("--bps", text, kBitRates);
      return true;
    default:
      return false;
  }
}

void take_option(int letter, const std::string &text, Options &options) {
  switch (letter) {
    case 'o':
      options.root = text;
      break;
    case 'c':
      options.channels = parse_list("--channels", text, ZV_CHANNELS);
      break;
    case 'a':
      options.audio = text == "none" ? 0 : parse_list("--audio", text, ZV_AUDIO_CHANNELS);
      break;
    case 'm':
      options.min_free = parse_number("--min-free", text, 1, 99);
      break;
    case 'f':
      options.delete_oldest = parse_name("--when-full", text, kWhenFull);
      break;
    case 's':
      options.sync = std::chrono::seconds(parse_number("--sync", text, 1, 3600));
      break;
    case 'u':
      options.buffer = std::size_t{parse_number("--buffer", text, 1, 4096)} << 20;
      break;
    default:
      options.quiet = true;
      break;
  }
}

/// Returns the channels that the card encodes at the full rate. Two fields count twice.
u32 most_channels(const Options &options) {
  const u32 channels = channels_within_budget(options.scale);
  return options.two_fields ? channels >> std::popcount(channels) / 2 : channels;
}

void check_two_fields(const Options &options) {
  if (options.scale == SCALE_ZV_D1) throw UsageError("--two-fields: --scale d1 has both fields in a picture");
  if (options.rate != 0)
    throw UsageError("--two-fields: the card encodes both fields only at the full --rate");
  const int most = std::popcount(most_channels(options)), wanted = std::popcount(options.channels);
  if (wanted > most)
    throw UsageError("--two-fields: the card encodes at most " + std::to_string(most) +
                     " channels of this --scale with two fields, not " + std::to_string(wanted));
}

void complete(Options &options, const Later &later) {
  if (options.root.empty()) throw UsageError("--root DIR is missing");
  while (options.root.size() > 1 && options.root.back() == '/') options.root.pop_back();
  if (options.root.size() > recording::kMaxRootBytes)
    throw UsageError("--root: a path may have at most " + std::to_string(recording::kMaxRootBytes) +
                     " bytes");
  if (later.qp && options.bit_rate != 0) throw UsageError("--qp and --bps exclude each other");
  if (!later.rate.empty()) options.rate = parse_name("--rate", later.rate, rate_names(options.standard));
  if (options.two_fields) check_two_fields(options);
  if (options.channels == 0) options.channels = most_channels(options);
  if (options.gop == 0) options.gop = static_cast<u32>(std::max(1L, std::lround(stream_rate(options, 0))));
}

}  // namespace

double stream_rate(const Options &options, unsigned stream) {
  constexpr double kAudioRate = 8000.0 / 128;
  if (!is_video(stream)) return kAudioRate;
  const auto rate = recording::exact_frame_rate(options.standard, options.rate).value();
  return static_cast<double>(rate.numerator) / rate.denominator * (options.two_fields ? 2 : 1);
}

Options parse_options(int argc, char **argv) {
  Options options;
  Later later;
  for (int letter; (letter = next_option(argc, argv, kOptions, kHelp)) != -1;) {
    const std::string text = optarg ? optarg : "";
    if (!take_picture_option(letter, text, options, later)) take_option(letter, text, options);
  }
  if (optind < argc) refuse_option(argv[optind], kOptions);
  complete(options, later);
  return options;
}

}  // namespace recorder
