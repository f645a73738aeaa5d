// zarvo_export: makes clips of recordings, and lists what is recorded.
#include <algorithm>
#include <cstdio>
#include <iterator>
#include <memory>
#include <stdexcept>

#include "clip.h"
#include "listing.h"
#include "options.h"
#include "programs/common/command_line.h"
#include "programs/common/stop_signal.h"

namespace {

using namespace clips;

constexpr int kFailed = 1;
constexpr int kWrongUse = 2;
constexpr int kIncomplete = 3;

constexpr Milliseconds kAroundMotion = 2000;

int list(const Options &options) {
  const auto rows = list_recordings(options);
  if (!options.svg.empty())
    draw(rows, options.svg, options.force);
  else if (options.json)
    print_json(rows);
  else
    print_table(rows);
  return 0;
}

/// Names the clock hours of a stretch that have no recording.
void report_missing_hours(const std::vector<Recording> &found, const Stretch &range, const std::string &what,
                          Report &report) {
  const auto is_missing = [&](Milliseconds hour) {
    return hour < range.to &&
           std::ranges::none_of(found, [hour](const Recording &r) { return r.hour == hour; });
  };
  for (Milliseconds hour = hour_begin(range.from); hour < range.to; hour += kHour) {
    const Milliseconds first = hour;
    while (is_missing(hour)) hour += kHour;
    if (hour > first)
      report.skipped("no recording of " + what + " from " + local_text(first) + " to " + local_text(hour));
  }
}

/// Returns the stretches with motion, and what is around them. Takes away the recordings that do not tell.
std::vector<Stretch> motion_in(std::vector<Recording> &recordings, const Stretch &range, Report &report) {
  std::vector<Stretch> stretches;
  for (const Recording &recording : recordings) {
    if (recording.index.empty()) {
      report.skipped(recording.path + ": no index tells of motion: skipped");
      continue;
    }
    for (Stretch stretch : contents_of(recording.index).motion) {
      stretch.from = std::max(stretch.from - kAroundMotion, range.from);
      stretch.to = std::min(stretch.to + kAroundMotion, range.to);
      if (stretch.from < stretch.to) append(stretches, stretch);
    }
  }
  std::erase_if(recordings, [](const Recording &recording) { return recording.index.empty(); });
  return stretches;
}

/// Tells when recordings without an index began, as well as that can be known.
void estimate_starts(std::vector<Recording> &recordings, const Options &options, Report &report) {
  for (Recording &recording : recordings) {
    if (recording.start) continue;
    const char *by = "by the time of the file";
    recording.start = start_by_file_time(recording, options.two_fields);
    // Files that the user names follow each other.
    const bool follows = recording.part > 0 || (!options.files.empty() && &recording != recordings.data());
    if (!recording.start && !follows) {
      recording.start = recording.hour;
      by = "the start of its hour";
    }
    if (recording.start)
      report.note(recording.path + " has no index: its times count from " + local_text(*recording.start) +
                  ", " + by);
  }
}

std::vector<Recording> recordings_of(const Options &options, Report &report) {
  std::vector<Recording> found;
  for (const std::string &file : options.files) found.push_back(recording_at(file));
  if (options.files.empty()) {
    found = find_recordings(options.root, recording::Kind::video, options.channel, options.range);
    report_missing_hours(found, options.range, "channel " + std::to_string(options.channel), report);
  }
  estimate_starts(found, options, report);
  return found;
}

int make_clip(const Options &options) {
  Report report;
  std::vector<Recording> recordings = recordings_of(options, report);
  std::unique_ptr<AudioReader> audio;
  if (options.audio != 0) {
    // Where the audio of an hour begins depends on the hour before.
    const Stretch before{options.range.from - kHour, options.range.from},
        around{before.from, options.range.to};
    const auto found = find_recordings(options.root, recording::Kind::audio, options.audio, around);
    report_missing_hours(found, options.range, "audio input " + std::to_string(options.audio), report);
    std::vector<Recording> beside = recordings;
    std::ranges::move(find_recordings(options.root, recording::Kind::video, options.channel, before),
                      std::back_inserter(beside));
    audio = std::make_unique<AudioReader>(found, beside, options.range.from, report);
  }
  std::vector<Stretch> stretches{options.range};
  if (options.motion) {
    stretches = motion_in(recordings, options.range, report);
    if (stretches.empty()) throw std::runtime_error("nothing moves there; no clip is written");
  }
  Clip clip(options, stretches, audio.get(), report);
  for (const Recording &recording : recordings) clip.add(recording);
  clip.finish();
  return report.complete() ? 0 : kIncomplete;
}

}  // namespace

int main(int argc, char **argv) try {
  const Options options = parse_options(argc, argv);
  av_log_set_level(AV_LOG_QUIET);
  if (options.list) return list(options);
  catch_stop_signals();
  return make_clip(options);
} catch (const UsageError &error) {
  std::fprintf(stderr, "zarvo_export: %s; see zarvo_export --help\n", error.what());
  return kWrongUse;
} catch (const std::exception &error) {
  std::fprintf(stderr, "zarvo_export: %s\n", error.what());
  return kFailed;
}
