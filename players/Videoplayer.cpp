/// Videoplayer FILE: plays a video recording (".rec") with ffplay, or with mpv where ffplay is missing.
#include <unistd.h>

#include <cstdio>
#include <cstring>
#include <optional>

#include "launch.h"
#include "record_file_header.h"

namespace {

/// Reads the header; the file then stands at the first byte of the stream.
std::optional<RECORD_FILE_HEADER> read_header(int file) {
  RECORD_FILE_HEADER header;
  // A pipe may hand the header over in pieces.
  for (std::size_t had = 0; had < sizeof header;) {
    const ssize_t part = read(file, reinterpret_cast<char *>(&header) + had, sizeof header - had);
    if (part <= 0) return std::nullopt;
    had += static_cast<std::size_t>(part);
  }
  return header;
}

/// The demuxer that splits the stream behind the header into frames, or null for an unknown tag.
const char *stream_format(const RECORD_FILE_HEADER &header) {
  const auto has_tag = [&](const char *tag) {
    return std::memcmp(header.codec_tag, tag, sizeof header.codec_tag) == 0;
  };
  return has_tag(kMpeg4Tag) ? "m4v" : has_tag(kMjpegTag) ? "mjpeg" : nullptr;
}

std::string window_title(const RECORD_FILE_HEADER &header, const char *path) {
  const std::string label(header.channel_label, strnlen(header.channel_label, sizeof header.channel_label));
  return label + " - " + players::base_name(path);
}

/// A camera's picture is 4:3 whatever its size in pixels; the pixels of a half-height one are not square.
std::vector<players::Command> commands(const RECORD_FILE_HEADER &header, const std::string &format,
                                       const std::string &title) {
  players::Command ffplay{"ffplay", {"-hide_banner", "-loglevel", "error", "-autoexit"}};
  players::Command mpv{"mpv", {"--video-aspect-override=4:3", "--demuxer=lavf"}};
  ffplay.arguments.insert(ffplay.arguments.end(),
                          {"-window_title", title, "-vf", "setdar=4/3", "-f", format});
  mpv.arguments.insert(mpv.arguments.end(), {"--title=" + title, "--demuxer-lavf-format=" + format});
  if (header.frame_rate > 0) {
    const std::string rate = std::to_string(header.frame_rate);
    ffplay.arguments.insert(ffplay.arguments.end(), {"-framerate", rate});
    mpv.arguments.push_back("--demuxer-lavf-o=framerate=" + rate);
  }
  ffplay.arguments.insert(ffplay.arguments.end(), {"-i", "pipe:0"});
  mpv.arguments.push_back("-");
  return {ffplay, mpv};
}

}  // namespace

int main(int argc, char **argv) {
  const int file = players::open_argument(argc, argv);
  if (file < 0) return 1;
  const auto header = read_header(file);
  const char *const format = header ? stream_format(*header) : nullptr;
  if (!format) {
    std::fprintf(stderr, "%s: no recording header\n", argv[1]);
    return 1;
  }
  return players::hand_over(file, argv[1], commands(*header, format, window_title(*header, argv[1])));
}
