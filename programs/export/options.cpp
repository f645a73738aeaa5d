// Parses the command line of zarvo_export.
#include "options.h"

#include <optional>

#include "programs/common/command_line.h"

namespace clips {
namespace {

constexpr const char *kHelp =
    R"(Usage: zarvo_export --root DIR --channel N --from TIME --to TIME [OPTION...] OUT.mkv|OUT.mp4
       zarvo_export [OPTION...] FILE.rec... OUT.mkv|OUT.mp4
       zarvo_export --root DIR --list [--channel N] [--from TIME] [--to TIME] [--json | --svg FILE]

Makes a clip of recordings without encoding the pictures again, or lists what is recorded.

  --root DIR      the folder of the recordings, which holds Video and Audio
  --channel N     the camera, 1 to 16
  --from TIME     local time, e.g. "2026-11-25 14:58" or "2026-11-25 14:58:30"; the clip begins with the intra
                  frame at or before it
  --to TIME       the same; the day may be left out. In the hour that comes twice in autumn, --from means the first
                  and --to the second; "2026-10-25 02:30 +0100", with the difference to UTC, leaves no doubt
  --audio N       adds an audio input, 1 to 4; a clip in mp4 gets it as AAC
  --motion        only the stretches with motion, with 2 seconds before and after each
  --two-fields    recordings without an index hold both fields of each frame
  --check         decodes every frame and skips those that are damaged; slower
  --force         overwrites OUT

  --list          lists hours, motion and gaps
  --json          the list as JSON
  --svg FILE      draws the list: a row for each channel, time to the right
  -h, --help      this text
  --version       the version

Exit status: 0 done, 1 no clip, 2 wrong use, 3 the clip is written and plays,
but lacks what the lines on standard error name.
)";

enum Letter { root = 1, channel, from, to, audio, motion, two_fields, check, force, list, json, svg };

constexpr option kOptions[] = {{"root", required_argument, nullptr, root},
                               {"channel", required_argument, nullptr, channel},
                               {"from", required_argument, nullptr, from},
                               {"to", required_argument, nullptr, to},
                               {"audio", required_argument, nullptr, audio},
                               {"motion", no_argument, nullptr, motion},
                               {"two-fields", no_argument, nullptr, two_fields},
                               {"check", no_argument, nullptr, check},
                               {"force", no_argument, nullptr, force},
                               {"list", no_argument, nullptr, list},
                               {"json", no_argument, nullptr, json},
                               {"svg", required_argument, nullptr, svg},
                               COMMON_OPTIONS};

struct Times {
  std::optional<std::string> from, to;
};

void set_option(int letter, Options &options, Times &times) {
  switch (letter) {
    case root:
      options.root = optarg;
      break;
    case channel:
      options.channel = parse_number("--channel", optarg, 1, ZV_CHANNELS);
      break;
    case audio:
      options.audio = parse_number("--audio", optarg, 1, ZV_AUDIO_CHANNELS);
      break;
    case from:
      times.from = optarg;
      break;
    case to:
      times.to = optarg;
      break;
    case svg:
      options.svg = optarg;
      break;
    default:
      for (const auto &[flag, value] :
           {std::pair{motion, &options.motion}, std::pair{two_fields, &options.two_fields},
            std::pair{check, &options.check}, std::pair{force, &options.force},
            std::pair{list, &options.list}, std::pair{json, &options.json}})
        if (flag == letter) *value = true;
  }
}

void set_range(const Times &times, Options &options) {
  std::optional<Milliseconds> begin;
  if (times.from) options.range.from = *(begin = parse_time("--from", *times.from, Pass::first));
  if (times.to) options.range.to = parse_time("--to", *times.to, Pass::second, begin);
  if (options.range.from >= options.range.to) throw UsageError("--to is not behind --from");
}

void refuse(bool wrong, const char *text) {
  if (wrong) throw UsageError(text);
}

void check_list(const Options &options) {
  refuse(options.root.empty(), "--list needs --root");
  refuse(!options.output.empty(), "--list makes no clip");
  refuse(options.json && !options.svg.empty(), "choose one of --json and --svg");
}

void check_clip(const Options &options, const Times &times) {
  refuse(options.output.empty(), "no OUT given");
  refuse(!options.output.ends_with(".mkv") && !options.output.ends_with(".mp4"),
         "OUT ends in neither .mkv nor .mp4");
  if (options.files.empty()) {
    refuse(options.root.empty(), "neither --root nor a recording given");
    refuse(options.channel == 0, "--root needs --channel");
    refuse(!times.from || !times.to, "--root needs --from and --to");
  } else {
    refuse(!options.root.empty() || options.channel != 0 || options.audio != 0,
           "--root, --channel and --audio cannot be used with recordings");
  }
}

}  // namespace

Options parse_options(int argc, char **argv) {
  Options options;
  Times times;
  for (int letter; (letter = next_option(argc, argv, kOptions, kHelp, &options.files)) >= 0;)
    set_option(letter, options, times);
  set_range(times, options);
  if (!options.files.empty()) {
    options.output = options.files.back();
    options.files.pop_back();
  }
  options.list = options.list || options.json || !options.svg.empty();
  if (options.list)
    check_list(options);
  else
    check_clip(options, times);
  return options;
}

}  // namespace clips
