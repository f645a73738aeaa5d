// Tells what a recording's pictures are, and when it began.
#include "video_format.h"

#include <sys/stat.h>

#include <algorithm>
#include <cstring>

namespace clips {
namespace {

/// A file may seem to begin this much before its hour: the card's clock is not that of the wall.
constexpr Milliseconds kEarly = 2000;

/// Returns the rate of frames, of both fields where they are encoded together.
recording::FrameRate frame_rate(const RECORD_FILE_HEADER &header, const std::string &label) {
  const ZV_VIDEO_STANDARD standard = recording::standard_of(header);
  const char *const *const labels = recording::frame_rate_list(standard);
  for (std::size_t row = 0; labels[row] != nullptr; ++row)
    if (labels[row] == label) return recording::exact_frame_rate(standard, row).value();
  return recording::exact_frame_rate(standard, 0).value();
}

}  // namespace

VideoFormat format_of(const StreamReader &reader, const Recording &recording, bool two_fields) {
  const RECORD_FILE_HEADER &header = reader.header();
  std::string label = recording::frame_rate_label(header);
  if (!recording.index.empty() && recording.index.front().kind == recording::IndexEntry::Kind::start) {
    label = recording.index.front().rate;
    two_fields = recording.index.front().fields == 2;
  }
  recording::FrameRate rate = frame_rate(header, label);
  if (two_fields) rate.numerator *= 2;
  return {reader.codec(), header.record_width, header.record_height, rate};
}

bool same(const VideoFormat &a, const VideoFormat &b) {
  return a.codec == b.codec && a.width == b.width && a.height == b.height &&
         a.rate.numerator == b.rate.numerator && a.rate.denominator == b.rate.denominator;
}

std::optional<Milliseconds> start_by_file_time(const Recording &recording, bool two_fields) try {
  struct stat info {};
  if (!recording.hour || stat(recording.path.c_str(), &info) != 0) return std::nullopt;
  const Milliseconds end = Milliseconds{info.st_mtim.tv_sec} * 1000 + info.st_mtim.tv_nsec / 1000000;
  if (end < recording.hour->from || end > recording.hour->to + kLateChange) return std::nullopt;
  StreamReader reader(recording.path);
  const recording::FrameRate rate = format_of(reader, recording, two_fields).rate;
  std::size_t frames = 0;
  for (Group group; reader.next(group);) frames += group.sizes.size() + group.lost;
  const Milliseconds start =
      end - static_cast<Milliseconds>(frames) * 1000 * rate.denominator / rate.numerator;
  return start >= recording.hour->from - kEarly ? std::optional(start) : std::nullopt;
} catch (const RecordingError &) {
  return std::nullopt;
}

}  // namespace clips
