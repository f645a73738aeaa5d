/// Videoplayer FILE: plays a video recording (".rec") with ffplay, or with mpv where ffplay is missing.
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <optional>

#include "frame_rates.h"
#include "launch.h"
#include "record_file_header.h"

namespace {

std::optional<RECORD_FILE_HEADER> read_header(int file) {
  RECORD_FILE_HEADER header;
  if (read(file, &header, sizeof header) != sizeof header) return std::nullopt;
  return header;
}

/// The demuxer that splits the stream behind the header into frames, or null for an unknown tag.
const char *stream_format(const RECORD_FILE_HEADER &header) {
  const auto has_tag = [&](const char *tag) {
    return std::memcmp(header.codec_tag, tag, sizeof header.codec_tag) == 0;
  };
  return has_tag(kMpeg4Tag) ? "m4v" : has_tag(kMjpegTag) ? "mjpeg" : nullptr;
}

std::string window_title(const RECORD_FILE_HEADER &header, const std::string &path) {
  const std::string label(header.channel_label, strnlen(header.channel_label, sizeof header.channel_label));
  return label + " - " + players::base_name(path);
}

/// The header's rate is cut to a whole number: one that is not in the list of rates stands for the first that
/// is cut to it, as 22 for 22.5. The picture's height tells the list.
std::string frame_rate(const RECORD_FILE_HEADER &header) {
  const bool ntsc = header.record_height % 240 == 0;
  std::string whole = std::to_string(header.frame_rate);
  std::string cut;
  for (const char *const *label = ntsc ? ntsc_fps_str : pal_fps_str; *label != nullptr; ++label) {
    if (*label == whole) return whole;
    if (cut.empty() && std::atoi(*label) == header.frame_rate) cut = *label;
  }
  return cut.empty() ? whole : cut;
}

/// A camera's picture is 4:3 whatever its size in pixels; the pixels of a half-height one are not square. The
/// players skip the header, so that they can seek in the file.
std::vector<players::Command> commands(const RECORD_FILE_HEADER &header, const std::string &format,
                                       const std::string &file) {
  const std::string title = window_title(header, file);
  const std::string skip = std::to_string(sizeof header);
  players::Command ffplay{"ffplay",
                          {"-hide_banner", "-loglevel", "error", "-autoexit", "-window_title", title, "-vf",
                           "setdar=4/3", "-f", format, "-skip_initial_bytes", skip}};
  std::string options = "skip_initial_bytes=" + skip;
  if (header.frame_rate > 0) {
    const std::string rate = frame_rate(header);
    ffplay.arguments.insert(ffplay.arguments.end(), {"-framerate", rate});
    options += ",framerate=" + rate;
  }
  ffplay.arguments.insert(ffplay.arguments.end(), {"-i", "file:" + file});
  return {ffplay,
          {"mpv",
           {"--video-aspect-override=4:3", "--demuxer=lavf", "--title=" + title,
            "--demuxer-lavf-format=" + format, "--demuxer-lavf-o=" + options, "--", file}}};
}

}  // namespace

int main(int argc, char **argv) {
  const int file = players::open_argument(argc, argv, sizeof(RECORD_FILE_HEADER));
  if (file < 0) return 1;
  const auto header = read_header(file);
  const char *const format = header ? stream_format(*header) : nullptr;
  if (!format) {
    std::fprintf(stderr, "%s: no recording header\n", argv[1]);
    return 1;
  }
  return players::hand_over(commands(*header, format, argv[1]));
}
