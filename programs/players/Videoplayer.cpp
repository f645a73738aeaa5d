// Videoplayer FILE: plays a video recording (".rec") with ffplay, or with mpv if ffplay is not installed.
#include <cstdio>
#include <cstdlib>

#include "launch.h"
#include "recording/frame_rates.h"
#include "recording/header.h"
#include "recording/index.h"

namespace {

/// Returns the name of the demuxer that splits the stream behind the header into frames.
const char *stream_format(ZV_VIDEO_CODEC codec) {
  return codec == VIDEO_CODEC_ZV_MJPEG ? "mjpeg" : "m4v";
}

/// Returns the pictures a second, as ffplay reads them; empty when unknown. The index beside a recording
/// tells the rate without doubt, and whether both fields of a frame are a picture each.
std::string picture_rate(const RECORD_FILE_HEADER &header, const std::string &file) {
  for (const recording::IndexEntry &entry : recording::fitting_index(file).entries) {
    if (entry.kind != recording::IndexEntry::Kind::start) continue;
    if (entry.fields != 2) return entry.rate;
    char twice[32];
    std::snprintf(twice, sizeof twice, "%g", 2 * std::strtod(entry.rate.c_str(), nullptr));
    return twice;
  }
  return header.frame_rate > 0 ? recording::frame_rate_label(header) : "";
}

/// Returns the command lines of ffplay and mpv. They show every picture as 4:3, whatever its size in pixels.
/// Both get the whole file, so that they can seek, and skip the header themselves.
std::vector<players::PlayerCommand> player_commands(const RECORD_FILE_HEADER &header,
                                                    const std::string &format, const std::string &file) {
  const std::string title = recording::label_of(header) + " - " + players::base_name(file);
  const std::string skip = std::to_string(sizeof header);
  players::PlayerCommand ffplay{"ffplay",
                                {"-hide_banner", "-loglevel", "error", "-autoexit", "-window_title", title,
                                 "-vf", "setdar=4/3", "-f", format, "-skip_initial_bytes", skip}};
  std::string options = "skip_initial_bytes=" + skip;
  if (const std::string rate = picture_rate(header, file); !rate.empty()) {
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
  const auto header = recording::read_header(file);
  const auto codec = header ? recording::codec_of(*header) : std::nullopt;
  if (!codec) {
    std::fprintf(stderr, "%s: no recording header\n", argv[1]);
    return 1;
  }
  return players::run_first_installed(player_commands(*header, stream_format(*codec), argv[1]));
}
