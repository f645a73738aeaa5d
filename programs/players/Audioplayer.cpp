// Audioplayer FILE: plays an audio recording (".aud") with ffplay, or with mpv if ffplay is not installed.
// The file has no header: G.726, 8000 samples a second, mono, 3 bits a sample.
#include "launch.h"

int main(int argc, char **argv) {
  if (players::open_argument(argc, argv, 0) < 0) return 1;
  const std::string file = argv[1];
  const std::string title = players::base_name(file);
  return players::run_first_installed(
      {{"ffplay",
        {"-hide_banner", "-loglevel", "error", "-autoexit", "-window_title", title, "-f", "g726",
         "-code_size", "3", "-sample_rate", "8000", "-i", "file:" + file}},
       {"mpv",
        {"--title=" + title, "--force-window", "--demuxer=lavf", "--demuxer-lavf-format=g726",
         "--demuxer-lavf-o=code_size=3,sample_rate=8000", "--", file}}});
}
