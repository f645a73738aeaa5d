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

std::string text_of(double number) {
  char text[32];
  std::snprintf(text, sizeof text, "%g", number);
  return text;
}

/// Returns the pictures a second, as ffplay reads them; empty when unknown. The index beside a recording
/// tells the rate without doubt, and whether both fields of a frame are a picture each.
std::string picture_rate(const RECORD_FILE_HEADER &header, const std::string &file) {
  for (const recording::IndexEntry &entry : recording::fitting_index(file).entries) {
    if (entry.kind != recording::IndexEntry::Kind::start) continue;
    if (entry.fields != 2) return entry.rate;
    return text_of(2 * std::strtod(entry.rate.c_str(), nullptr));
  }
  return header.frame_rate > 0 ? recording::frame_rate_label(header) : "";
}

/// Returns how many times as long as a player believes a recording lasts. The header of an MPEG-4 stream
/// states 30000/1001 pictures a second whatever the rate is, and ffplay and mpv believe it.
double stretch_of(const RECORD_FILE_HEADER &header, const std::string &rate) {
  if (recording::codec_of(header) != VIDEO_CODEC_ZV_MPEG4 || rate.empty()) return 1;
  // The labels of NTSC are parts of 30 for what is 30000/1001.
  const bool ntsc = recording::standard_of(header) == VIDEO_STANDARD_ZV_NTSC;
  return (ntsc ? 30 : 30000.0 / 1001) / std::strtod(rate.c_str(), nullptr);
}

/// Returns the command lines of ffplay and mpv. They show every picture as 4:3, whatever its size in pixels.
/// Both get the whole file, so that they can seek, and skip the header themselves.
std::vector<players::PlayerCommand> player_commands(const RECORD_FILE_HEADER &header,
                                                    const std::string &format, const std::string &file) {
  const std::string title = recording::label_of(header) + " - " + players::base_name(file);
  const std::string skip = std::to_string(sizeof header);
  const std::string rate = picture_rate(header, file);
  const double stretch = stretch_of(header, rate);
  const std::string filter = stretch == 1 ? "setdar=4/3" : "setdar=4/3,setpts=PTS*" + text_of(stretch);
  players::PlayerCommand ffplay{"ffplay",
                                {"-hide_banner", "-loglevel", "error", "-autoexit", "-window_title", title,
                                 "-vf", filter, "-f", format, "-skip_initial_bytes", skip}};
  std::string options = "skip_initial_bytes=" + skip;
  if (!rate.empty()) {
    ffplay.arguments.insert(ffplay.arguments.end(), {"-framerate", rate});
    options += ",framerate=" + rate;
  }
  ffplay.arguments.insert(ffplay.arguments.end(), {"-i", "file:" + file});
  return {
      ffplay,
      {"mpv",
       {"--video-aspect-override=4:3", "--speed=" + text_of(1 / stretch), "--demuxer=lavf",
        "--title=" + title, "--demuxer-lavf-format=" + format, "--demuxer-lavf-o=" + options, "--", file}}};
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
