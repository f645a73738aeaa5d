#include <sys/wait.h>

#include <QFileDialog>
#include <QTimer>

#include "recording_fixture.h"

namespace {

class Playback : public RecordingTest {
 protected:
  void write_program(const fs::path &path, const std::string &script) {
    std::ofstream(path) << "#!/bin/sh\n" << script << "\n";
    fs::permissions(path, fs::perms::owner_all);
  }

  /// Presses Open and chooses a file, or cancels the choice for an empty path.
  std::string play(const std::string &path) {
    QTimer::singleShot(0, dialog.get(), [&, path] {
      auto *const chooser = qobject_cast<QFileDialog *>(QApplication::activeModalWidget());
      ASSERT_TRUE(chooser);
      EXPECT_EQ(chooser->objectName(), "Playback");
      EXPECT_EQ(chooser->directory().absolutePath().toStdString(), fs::current_path());
      EXPECT_FALSE(dialog->btnRecordStart->isEnabled());
      if (path.empty()) return chooser->reject();
      chooser->selectFile(QString::fromStdString(path));
      static_cast<QDialog *>(chooser)->accept();
    });
    const std::string lines = printed_by([&] { dialog->btnPlayback->click(); });
    EXPECT_TRUE(dialog->btnRecordStart->isEnabled());
    return lines;
  }
};

// The names are what an operator's folders may be called; each must reach its player as one word.
TEST_F(Playback, TheChosenFileReachesItsPlayerAsOneArgument) {
  for (const char *player : {"Videoplayer", "Audioplayer"}) {
    write_program(player, "printf '%s|%s' \"$0\" \"$#|$1\" > played");
  }
  const std::string deep = std::string(120, 'l') + "/" + std::string(120, 'm') + "/n.rec";
  for (const std::string name :
       {"a.rec", "a.aud", "x.rec/a.aud", "a.REC", "it's a 'name'.rec", "$(touch gone) `touch gone`.rec",
        "; touch gone \\ \"*\"/a.aud", "K\xC3\xA4mera.rec", deep.c_str()}) {
    const fs::path path = fs::current_path() / name;
    fs::create_directories(path.parent_path());
    std::ofstream(path) << "x";
    EXPECT_EQ(play(path), "");
    const std::string player = name.find(".rec") == std::string::npos ? "./Audioplayer" : "./Videoplayer";
    EXPECT_EQ(content_of("played"), player + "|1|" + path.string());
    fs::remove("played");
  }
  EXPECT_FALSE(fs::exists("gone"));
  EXPECT_EQ(play(""), "");
  EXPECT_FALSE(fs::exists("played"));
  fake_system::shell_broken = true;
  EXPECT_EQ(play(fs::current_path() / "a.rec"), "Playback error!\n");
}

// The players themselves, with a stand-in for ffplay that tells its arguments and its input.
TEST_F(Playback, PlayersHandTheStreamOver) {
  fs::create_directory("bin");
  write_program("bin/ffplay", "printf '%s ' \"$@\"; exec /bin/cat");
  const std::string header("MPG4\x60\1\0\0\xF0\0\0\0\x16\0\0\0Channel 12\0\0\0\0\0\0", 32);
  std::ofstream("it's.rec") << header << "stream";
  std::ofstream("j.rec") << "MJPG" << header.substr(4) << "jpegs";
  std::ofstream("bad.rec") << "RIFF" << header;
  std::ofstream("short.rec") << header.substr(1);
  std::ofstream("a.aud") << "blocks";
  const struct {
    const char *command, *output;
    int status;
  } rows[] = {
      {VIDEOPLAYER " \"it's.rec\"", " - it's.rec -vf setdar=4/3 -f m4v -framerate 22 -i pipe:0 stream", 0},
      {VIDEOPLAYER " j.rec", "Channel 12 - j.rec -vf setdar=4/3 -f mjpeg -framerate 22 -i pipe:0 jpegs", 0},
      {AUDIOPLAYER " a.aud", "-f g726 -code_size 3 -sample_rate 8000 -i pipe:0 blocks", 0},
      {VIDEOPLAYER " bad.rec", "bad.rec: no recording header\n", 1},
      {VIDEOPLAYER " short.rec", "short.rec: no recording header\n", 1},
      {VIDEOPLAYER " missing.rec", "missing.rec: No such file or directory\n", 1},
      {AUDIOPLAYER " bin", "bin: not a recording but a folder\n", 1},
      {AUDIOPLAYER " a b", " FILE\n", 1},
      {"PATH=/nowhere; " AUDIOPLAYER " a.aud", "Install ffplay (package ffmpeg) or mpv.\n", 1}};
  for (const auto &row : rows) {
    const int status =
        std::system((std::string("{ PATH=$PWD/bin; ") + row.command + "; } > out 2>&1").c_str());
    EXPECT_EQ(WEXITSTATUS(status), row.status) << row.command;
    EXPECT_THAT(content_of("out"), testing::EndsWith(row.output)) << row.command;
  }
}

}  // namespace
