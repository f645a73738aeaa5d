/**
 * @file listing.h
 * Shows what is recorded: as a table, as JSON, as a picture.
 */
#ifndef EXPORT_LISTING_H
#define EXPORT_LISTING_H

#include <string>
#include <vector>

#include "catalogue.h"
#include "options.h"
#include "report.h"

namespace clips {

/// A row of the list.
struct ListedRecording {
  Recording recording;  ///< with its contents; without an index they are the whole clock hour of video
  bool video;

  /// Returns "channel 3" or "audio 2".
  std::string name() const { return (video ? "channel " : "audio ") + std::to_string(recording.number); }
  /// Whether the times are those of the recording.
  bool is_known() const { return !video || !recording.index.empty(); }
};

/// Reports indexes that are not used.
std::vector<ListedRecording> list_recordings(const Options &options, Report &report);

void print_table(const std::vector<ListedRecording> &rows);
void print_json(const std::vector<ListedRecording> &rows);
/// Draws an SVG. Throws std::runtime_error if the file cannot be written or exists and `force` is false.
void draw(const std::vector<ListedRecording> &rows, const std::string &file, bool force);

}  // namespace clips

#endif
