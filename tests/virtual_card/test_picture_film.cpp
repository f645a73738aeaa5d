// Films in front of a camera.

#include <sys/stat.h>

#include <filesystem>
#include <fstream>

#include "picture/film.h"
#include "picture_test.h"

namespace {

/// Luma of frame n of the clip.
constexpr u8 level(int frame) {
  return static_cast<u8>(40 + 30 * frame);
}

/// A folder of film files.
struct Folder {
  Folder() { std::filesystem::create_directories(path); }
  ~Folder() { std::filesystem::remove_all(path); }

  std::string file(const std::string &name, const std::string &bytes) const {
    std::ofstream(path / name, std::ios::binary) << bytes;
    return path / name;
  }
  /// A clip of plain frames, each lighter than the one before.
  std::string clip(int frames, int rate) const {
    std::string bytes = "YUV4MPEG2 W64 H48 F" + std::to_string(rate) + ":1 Ip A1:1 C420mpeg2\n";
    for (int i = 0; i < frames; ++i)
      bytes += "FRAME\n" + std::string(64 * 48, static_cast<char>(level(i))) + std::string(32 * 24, '\x60') +
               std::string(32 * 24, '\x90');
    return file("clip.y4m", bytes);
  }

  const std::filesystem::path path =
      std::filesystem::temp_directory_path() / ("films" + std::to_string(getpid()));
};

// Catches: a film at the card's speed instead of its own, a loop with a gap or a frame twice, a jump of hours
// that is off.
TEST_F(PictureTest, FilmsRunAtTheirOwnSpeedAndLoopWithoutASeam) {
  const auto film = card::Film::open(Folder().clip(6, 10), nullptr);
  ASSERT_TRUE(film);
  card::Picture picture;
  picture.resize(720, 480);
  const auto shown = [&](double seconds) {
    film->seek(seconds);
    film->copy_to(picture);
    return picture.y_line(200)[300];
  };
  std::vector<double> times{7200.05, 7200.15, 86400.35, 86401.15};
  for (int i = 200; i-- > 0;) times.insert(times.begin(), i / 29.97);
  for (const double passed : times)  // the film begins when it is first seen
    ASSERT_NEAR(shown(100 + passed), level(static_cast<int>(passed * 10 + 1e-6) % 6), 1) << passed << " s";
  EXPECT_NEAR(picture.cb_line(10)[10], 0x60, 1);
}

// Catches: a film that the drawn camera shines through, that escapes mask and properties, or comes and goes
// late.
TEST_F(PictureTest, FilmsStandInFrontOfTheirCameraOnly) {
  for (const unsigned channel : {2u, 3u}) encode(channel, kCif, 1);
  state.channel[2].mask = {2, 0, 360, 0, 240};
  state.channel[2].picture.saturation = 0;
  const Folder folder;
  std::string error;
  ASSERT_TRUE(engine.show_film(2, folder.clip(1, 1), &error)) << error;
  const Frame film = look(2);
  EXPECT_TRUE(near(film.at(75, 75), {level(0), 128, 128}));
  EXPECT_TRUE(near(film.at(75, 2), {level(0), 128, 128}));
  EXPECT_TRUE(near(film.at(25, 25), card::kMaskGrey));
  EXPECT_FALSE(film.mark());
  EXPECT_EQ(look(3).mark()->channel, 3u);
  state.channel[2].lost = true;
  EXPECT_TRUE(near(look(2).at(75, 75), card::kLostBlue));
  state.channel[2].lost = false;
  EXPECT_TRUE(near(look(2).at(75, 75), {level(0), 128, 128}));
  ASSERT_TRUE(engine.show_film(2, "", &error));
  EXPECT_FALSE(near(look(2).at(75, 75), {level(0), 128, 128}));
  EXPECT_EQ(look(2).mark()->channel, 2u);
}

TEST_F(PictureTest, BadFilmsAreRefusedWithAReasonAndTheCameraStays) {
  encode(0, kCif, 1);
  const Folder folder;
  const std::string files[] = {folder.path / "missing.mp4",
                               folder.path,
                               folder.file("empty.avi", ""),
                               folder.file("text.mp4", "no film, but words"),
                               folder.file("short.y4m", "YUV4MPEG2 W64 H48 F10:1 Ip A1:1 C420\nFRAME\nabc"),
                               folder.path / "pipe",           // waits for a writer if it is opened
                               "file:" + folder.clip(2, 25)};  // a URL, which may lead anywhere
  mkfifo(files[5].c_str(), 0600);
  for (const std::string &path : files) {
    std::string error;
    EXPECT_FALSE(engine.show_film(0, path, &error)) << path;
    EXPECT_EQ(error.rfind(path + ": ", 0), 0u) << error;
    EXPECT_GT(error.size(), path.size() + 4);
  }
  EXPECT_FALSE(engine.show_film(16, folder.clip(2, 25), nullptr));
  EXPECT_TRUE(look(0).mark());
}

}  // namespace
