// Prints what is recorded as a table or as JSON.
#include "listing.h"

#include <algorithm>
#include <cstdio>
#include <iostream>
#include <nlohmann/json.hpp>

#include "audio_reader.h"

namespace clips {
namespace {

using Json = nlohmann::ordered_json;

Json as_json(const std::vector<Stretch> &stretches) {
  Json list = Json::array();
  for (const Stretch &stretch : stretches)
    list.push_back({{"from", local_text(stretch.from)},
                    {"to", local_text(stretch.to)},
                    {"seconds", static_cast<double>(stretch.to - stretch.from) / 1000}});
  return list;
}

/// Returns the length of all stretches together.
Milliseconds total(const std::vector<Stretch> &stretches) {
  Milliseconds sum = 0;
  for (const Stretch &stretch : stretches) sum += stretch.to - stretch.from;
  return sum;
}

}  // namespace

std::vector<ListedRecording> list_recordings(const Options &options, Report &report) {
  using recording::Kind;
  const auto video =
      find_recordings(options.root, Kind::video, options.channel, options.range, Indexes::reduced);
  std::vector<ListedRecording> rows;
  rows.reserve(video.size());
  for (const Recording &recording : video) {
    rows.push_back({recording, true});
    if (recording.index.empty()) rows.back().recording.contents.recorded = *recording.hour;
  }
  if (options.channel == 0) {
    const auto audio = find_recordings(options.root, Kind::audio, 0, options.range, Indexes::reduced);
    const auto runs = audio_runs(audio, video);
    for (std::size_t file = 0; file < audio.size(); ++file) {
      const auto run = std::ranges::find(runs, file, &AudioRun::file);
      const bool has_index = !audio[file].index.empty();
      if (!has_index && run == runs.end()) continue;
      rows.push_back({audio[file], false});
      if (!has_index) rows.back().recording.contents.recorded = {run->start, run->end()};
    }
  }
  for (const ListedRecording &row : rows) note_doubt(row.recording, report);
  std::erase_if(rows,
                [&](const auto &row) { return !row.recording.contents.recorded.overlaps(options.range); });
  return rows;
}

void print_table(const std::vector<ListedRecording> &rows) {
  std::printf("%-11s %-19s  %-19s %9s %9s %6s %9s  %s\n", "", "from", "to", "length", "motion", "gaps",
              "gaps", "file");
  for (const ListedRecording &row : rows) {
    const auto &[recorded, motion, gaps, lost] = row.recording.contents;
    std::printf("%-11s %-19s  %-19s ", row.name().c_str(), local_text(recorded.from).c_str(),
                local_text(recorded.to).c_str());
    const std::string length = row.is_known() ? length_text(recorded.to - recorded.from) : "no index";
    std::printf("%9s ", length.c_str());
    if (row.recording.index.empty())
      std::printf("%9s %6s %9s", "", "", "");
    else
      std::printf("%9s %6zu %9s", row.video ? length_text(total(motion)).c_str() : "", gaps.size(),
                  length_text(total(gaps)).c_str());
    std::printf("  %s%s\n", row.recording.path.c_str(),
                lost > 0 ? (", " + std::to_string(lost) + " frames lost").c_str() : "");
  }
}

void print_json(const std::vector<ListedRecording> &rows) {
  Json list = Json::array();
  for (const ListedRecording &row : rows) {
    Json item;
    item[row.video ? "channel" : "audio"] = row.recording.number;
    item["file"] = row.recording.path;
    item["index"] = !row.recording.index.empty();
    item["from"] = local_text(row.recording.contents.recorded.from);
    item["to"] = local_text(row.recording.contents.recorded.to);
    if (!row.recording.index.empty()) {
      if (row.video) item["motion"] = as_json(row.recording.contents.motion);
      item["gaps"] = as_json(row.recording.contents.gaps);
      item["lost_frames"] = row.recording.contents.lost_frames;
    }
    list.push_back(item);
  }
  std::cout << list.dump(2, ' ', false, Json::error_handler_t::replace) << "\n";
}

}  // namespace clips
