#include <sys/stat.h>
#include <sys/wait.h>

#include <QFileDialog>
#include <QMouseEvent>
#include <QTimer>

#include "recording/header.h"
#include "recording_fixture.h"

namespace {

class Playback : public RecordingTest {
 protected:
  void write_program(const fs::path &path, const std::string &script) {
    std::ofstream(path) << "#!/bin/sh\n" << script << "\n";
    fs::permissions(path, fs::perms::owner_all);
  }

  /// Presses Open, then selects `file` in the chooser, or types its name if `typed`. If `file` is empty,
  /// cancels the chooser.
  std::string play(const std::string &file, bool typed = false) {
    QTimer::singleShot(0, dialog.get(), [&] {
      auto *const chooser = qobject_cast<QFileDialog *>(QApplication::activeModalWidget());
      ASSERT_TRUE(chooser);
      EXPECT_EQ(chooser->objectName(), "Playback");
      EXPECT_EQ(chooser->directory().absolutePath().toStdString(), fs::current_path());
      EXPECT_FALSE(dialog->btnRecordStart->isEnabled());
      if (file.empty()) return chooser->reject();
      const QString name = QString::fromStdString(file);
      typed ? chooser->findChild<QLineEdit *>("fileNameEdit")->setText(name) : chooser->selectFile(name);
      static_cast<QDialog *>(chooser)->accept();
    });
    QTimer give_up;  // a name that is refused leaves a message on the screen
    give_up.callOnTimeout([] {
      if (QWidget *const refusal = QApplication::activeModalWidget()) refusal->close();
    });
    give_up.start(2000);
    std::string lines = printed_by([&] { dialog->btnPlayback->click(); });
    EXPECT_TRUE(dialog->btnRecordStart->isEnabled());
    return lines;
  }
};

// The names are what an operator's folders may be called; each must reach its player as one word. A name
// with a double quote cannot be chosen through Qt's own reading of what is typed, and a link hides by its
// name what kind of recording it leads to.
TEST_F(Playback, TheChosenFileReachesItsPlayerAsOneArgument) {
  for (const char *player : {"Videoplayer", "Audioplayer"}) {
    write_program(player, "printf '%s|%s' \"$0\" \"$#|$1\" > played");
  }
  const fs::path here = fs::current_path();
  const std::string deep = std::string(120, 'l') + "/" + std::string(120, 'm') + "/n.rec";
  const std::string quoted = "a \"b\".rec";
  fs::create_symlink(quoted, "link.aud");
  const auto expect_played = [&](const std::string &chosen, bool typed, const std::string &file) {
    EXPECT_EQ(play(chosen, typed), "");
    const std::string player = file.find(".rec") == std::string::npos ? "./Audioplayer" : "./Videoplayer";
    EXPECT_EQ(content_of("played"), player + "|1|" + file) << chosen;
    fs::remove("played");
  };
  for (const std::string name :
       {"a.rec", "a.aud", "x.rec/a.aud", "a.REC", "it's a 'name'.rec", "$(touch gone) `touch gone`.rec",
        "; touch gone \\ \"*\"/a.aud", "K\xC3\xA4mera.rec", deep.c_str(), quoted.c_str()}) {
    const fs::path path = here / name;
    fs::create_directories(path.parent_path());
    std::ofstream(path) << "x";
    expect_played(path, false, path);
  }
  for (const std::string &typed : {quoted, (here / quoted).string(), std::string("link.aud")})
    expect_played(typed, true, here / quoted);
  EXPECT_FALSE(fs::exists("gone"));
  EXPECT_EQ(play(""), "");
  EXPECT_FALSE(fs::exists("played"));
  fake_system::shell_broken = true;
  EXPECT_EQ(play(here / "a.rec"), "Playback error!\n");
}

TEST_F(Playback, ClicksAndKeysThatComeWhileThePlayerRunsAreDropped) {
  write_program("Videoplayer", "");
  std::ofstream("a.rec") << "x";
  fake_system::while_playing = [this] {
    const QPointF middle(dialog->btnSplit4->rect().center());
    for (const auto type : {QEvent::MouseButtonPress, QEvent::MouseButtonRelease})
      QApplication::postEvent(dialog->btnSplit4,
                              new QMouseEvent(type, middle, middle, Qt::LeftButton, Qt::LeftButton, {}));
    for (const auto type : {QEvent::KeyPress, QEvent::KeyRelease})
      QApplication::postEvent(dialog->btnSplit9, new QKeyEvent(type, Qt::Key_Space, {}));
  };
  play(fs::current_path() / "a.rec");
  QApplication::processEvents();
  EXPECT_EQ(zv_mode, MUX_MODE_ZV_1CH);
  std::exchange(fake_system::while_playing, nullptr)();  // the same input later
  QApplication::processEvents();
  EXPECT_EQ(zv_mode, MUX_MODE_ZV_9CH);
}

std::string record_header(const char *tag, int lines, int rate) {
  RECORD_FILE_HEADER header{{}, 352, lines, rate, "Channel 12"};
  std::memcpy(header.codec_tag, tag, sizeof header.codec_tag);
  return {reinterpret_cast<const char *>(&header), sizeof header};
}

// The players themselves, with a stand-in for ffplay that tells its arguments.
TEST_F(Playback, PlayersHandTheFileOver) {
  fs::create_directory("bin");
  write_program("bin/ffplay", "printf '%s ' \"$@\"");
  const auto write = [](const char *name, const std::string &content) { std::ofstream(name) << content; };
  write("it's.rec", record_header("MPG4", 240, 7) + "stream");
  write("pal.rec", record_header("MJPG", 288, 16) + "stream");    // 16.67, cut
  write("whole.rec", record_header("MJPG", 288, 20) + "stream");  // 20 and not 20.83
  write("header.rec", record_header("MPG4", 240, 30));
  write("bad.rec", "RIFF" + record_header("MPG4", 240, 30));
  write("a.aud", "blocks");
  write("fields.rec", record_header("MPG4", 240, 30) + "stream");
  write("fields.idx",
        R"({"event":"start","time":1,"offset":32,"standard":"ntsc","rate":"30","fields":2,"audio":[]})");
  fs::create_directory("CH02");
  fs::copy("a.aud", "CH02/a.aud");
  ASSERT_EQ(mkfifo("pipe.rec", 0600), 0);
  const std::string video = " -skip_initial_bytes 32 -framerate ";
  const struct {
    const char *command;
    std::string output;
    int status;
  } rows[] = {
      {VIDEOPLAYER " \"it's.rec\"", " -vf setdar=4/3,setpts=PTS*4 -f m4v" + video + "7.5 -i file:it's.rec ",
       0},
      {VIDEOPLAYER " pal.rec",
       "Channel 12 - pal.rec -vf setdar=4/3 -f mjpeg" + video + "16.67 -i file:pal.rec ", 0},
      {VIDEOPLAYER " whole.rec", video + "20 -i file:whole.rec ", 0},
      {VIDEOPLAYER " fields.rec", "setdar=4/3,setpts=PTS*0.5 -f m4v" + video + "60 -i file:fields.rec ", 0},
      {AUDIOPLAYER " CH02/a.aud",
       "-window_title Audio 2 - a.aud -f g726 -code_size 3 -sample_rate 8000 -i file:CH02/a.aud ", 0},
      {AUDIOPLAYER " a.aud", "-window_title a.aud -f g726 -code_size 3 -sample_rate 8000 -i file:a.aud ", 0},
      {VIDEOPLAYER " bad.rec", "bad.rec: no recording header\n", 1},
      {VIDEOPLAYER " header.rec", "header.rec: nothing is recorded in this file\n", 1},
      {VIDEOPLAYER " missing.rec", "missing.rec: No such file or directory\n", 1},
      {VIDEOPLAYER " pipe.rec", "pipe.rec: not a recording\n", 1},
      {AUDIOPLAYER " bin", "bin: not a recording\n", 1},
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
