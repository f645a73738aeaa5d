/// Audioplayer FILE: plays an audio recording (".aud") with ffplay, or with mpv where ffplay is missing.
/// The file has no header: 8000 samples a second, mono, 3 bits a sample.
#include "launch.h"

int main(int argc, char **argv) {
  const int file = players::open_argument(argc, argv);
  if (file < 0) return 1;
  const std::string title = players::base_name(argv[1]);
  return players::hand_over(
      file, argv[1],
      {{"ffplay",
        {"-hide_banner", "-loglevel", "error", "-autoexit", "-window_title", title, "-f", "g726",
         "-code_size", "3", "-sample_rate", "8000", "-i", "pipe:0"}},
       {"mpv",
        {"--title=" + title, "--force-window", "--demuxer=lavf", "--demuxer-lavf-format=g726",
         "--demuxer-lavf-o=code_size=3,sample_rate=8000", "-"}}});
}
