// Audioplayer FILE: plays an audio recording (".aud") with ffplay, or with mpv if ffplay is not installed.
// The file has no header: G.726, 8000 samples a second, mono, 3 bits a sample.
#include <algorithm>
#include <string>

#include "launch.h"
#include "recording/tree.h"
#include "zv_type.h"

namespace {

/// Returns "Audio 2 - 20090303-14.aud" for a file in a folder "CH02", and the file's name elsewhere.
std::string title_of(const std::string &file) {
  const std::string name = players::base_name(file);
  const std::string folder =
      players::base_name(file.substr(0, file.size() - std::min(file.size(), name.size() + 1)));
  const auto input = recording::parse_channel_folder(folder);
  return input && *input < ZV_AUDIO_CHANNELS ? "Audio " + std::to_string(*input + 1) + " - " + name : name;
}

}  // namespace

int main(int argc, char **argv) {
  if (players::open_argument(argc, argv, 0) < 0) return 1;
  const std::string file = argv[1];
  const std::string title = title_of(file);
  return players::run_first_installed(
      {{"ffplay",
        {"-hide_banner", "-loglevel", "error", "-autoexit", "-window_title", title, "-f", "g726",
         "-code_size", "3", "-sample_rate", "8000", "-i", "file:" + file}},
       {"mpv",
        {"--title=" + title, "--force-window", "--demuxer=lavf", "--demuxer-lavf-format=g726",
         "--demuxer-lavf-o=code_size=3,sample_rate=8000", "--", file}}});
}
