// Finds the recordings of a clip, and makes it.
#include "make_clip.h"

#include <algorithm>
#include <iterator>
#include <memory>
#include <stdexcept>

#include "clip.h"

namespace clips {
namespace {

constexpr Milliseconds kAroundMotion = 2000;

/// Names the clock hours of a stretch that have no recording.
void report_missing_hours(const std::vector<Recording> &found, const Stretch &range, const std::string &what,
                          Report &report) {
  const auto is_missing = [&](Milliseconds hour) {
    return hour < range.to && std::ranges::none_of(found, [hour](const Recording &r) {
             return r.hour && r.hour->overlaps({hour, hour + kHour});
           });
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
  std::vector<Stretch> found, stretches;
  std::string none = "nothing is recorded there";
  for (const Recording &recording : recordings) {
    if (recording.index.empty()) {
      report.skipped(recording.path + ": no index tells of motion: skipped");
      none = "no index tells of motion there";
      continue;
    }
    const Contents contents = contents_of(recording.index);
    if (contents.recorded.overlaps(range)) none = "there is no motion";
    for (Stretch stretch : contents.motion) {
      stretch.from = std::max(stretch.from - kAroundMotion, range.from);
      stretch.to = std::min(stretch.to + kAroundMotion, range.to);
      if (stretch.from < stretch.to) found.push_back(stretch);
    }
  }
  // Not in order if the clock was set back.
  std::ranges::sort(found, {}, &Stretch::from);
  for (const Stretch &stretch : found) append(stretches, stretch);
  if (stretches.empty()) throw std::runtime_error(none + "; no clip is written");
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
      if (recording.hour) recording.start = recording.hour->from;
      by = "the start of its hour";
    }
    if (recording.start)
      report.note(recording.path + (recording.doubt.empty() ? " has no index: its" : ": its") +
                  " times count from " + local_text(*recording.start) + ", " + by);
  }
}

std::vector<Recording> recordings_of(const Options &options, Report &report) {
  std::vector<Recording> found;
  for (const std::string &file : options.files) found.push_back(recording_at(file));
  if (options.files.empty()) {
    found = find_recordings(options.root, recording::Kind::video, options.channel, options.range);
    report_missing_hours(found, options.range, "channel " + std::to_string(options.channel), report);
  }
  for (const Recording &recording : found) note_doubt(recording, report);
  estimate_starts(found, options, report);
  return found;
}

/// Returns a reader of the audio input beside the recordings of a clip; null if the clip has no audio.
std::unique_ptr<AudioReader> audio_of(const Options &options, const std::vector<Recording> &recordings,
                                      Report &report) {
  if (options.audio == 0) return nullptr;
  // Where the audio of an hour begins depends on the hour before.
  const Stretch before{options.range.from - kHour, options.range.from}, around{before.from, options.range.to};
  const auto found = find_recordings(options.root, recording::Kind::audio, options.audio, around);
  report_missing_hours(found, options.range, "audio input " + std::to_string(options.audio), report);
  for (const Recording &recording : found) note_doubt(recording, report);
  std::vector<Recording> beside = recordings;
  std::ranges::move(find_recordings(options.root, recording::Kind::video, options.channel, before),
                    std::back_inserter(beside));
  return std::make_unique<AudioReader>(found, beside, options.range.from, report);
}

}  // namespace

void make_clip(const Options &options, Report &report) {
  std::vector<Recording> recordings = recordings_of(options, report);
  if (recordings.empty()) throw std::runtime_error("nothing is recorded there; no clip is written");
  const std::unique_ptr<AudioReader> audio = audio_of(options, recordings, report);
  std::vector<Stretch> stretches{options.range};
  if (options.motion) stretches = motion_in(recordings, options.range, report);
  Clip clip(options, stretches, audio.get(), report);
  for (const Recording &recording : recordings) clip.add(recording);
  clip.finish();
}

}  // namespace clips
