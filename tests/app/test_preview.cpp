// The preview thread and its controls, and the dialog's way of opening and leaving the card. SDL's calls
// pass through this program on their way, so that a test sees what reached the window.
#include <SDL.h>

#include <QTest>
#include <algorithm>
#include <atomic>
#include <csignal>
#include <mutex>
#include <utility>
#include <vector>

#include "dialog_fixture.h"
#include "preview_thread.h"
#include "sdl.h"
#include "zv_driver.h"
#include "zv_lib.h"

extern SDL_Overlay *overlay;  // the preview window's

namespace {

struct Window {
  bool no_window = false, no_overlay = false;
  std::atomic<int> pictures = 0;
  std::mutex mutex;  // guards what follows
  std::vector<std::string> captions;
  std::vector<Uint8> plane;
  int width = 0, height = 0;
} window;

}  // namespace

extern "C" {
SDL_Surface *SDL_SetVideoMode(int width, int height, int bits, Uint32 flags) {
  return window.no_window ? nullptr : real("SDL_SetVideoMode", SDL_SetVideoMode)(width, height, bits, flags);
}
SDL_Overlay *SDL_CreateYUVOverlay(int width, int height, Uint32 format, SDL_Surface *surface) {
  return window.no_overlay
             ? nullptr
             : real("SDL_CreateYUVOverlay", SDL_CreateYUVOverlay)(width, height, format, surface);
}
int SDL_DisplayYUVOverlay(SDL_Overlay *shown, SDL_Rect *rect) {
  const std::lock_guard lock(window.mutex);
  window.plane.assign(shown->pixels[0], shown->pixels[0] + shown->pitches[0] * shown->h);
  window.width = rect->w;
  window.height = rect->h;
  ++window.pictures;
  return 0;
}
void SDL_WM_SetCaption(const char *title, const char *) {
  const std::lock_guard lock(window.mutex);
  window.captions.emplace_back(title);
}
}

namespace {

const std::string kEnd = "Exit video thread\n";

class PreviewTest : public DialogTest {
 protected:
  void TearDown() override {
    DialogTest::TearDown();
    EXPECT_EQ(SDL_WasInit(0), 0u);
  }
  void press(QPushButton *button) { QTest::mouseClick(button, Qt::LeftButton); }
  void wait_for_pictures(int number) {
    const int before = window.pictures;
    ASSERT_TRUE(eventually([&] { return window.pictures >= before + number; }));
  }
  // What the thread prints when it is started and ends by itself.
  std::string printed_by_thread() {
    return printed_by([this] {
      dialog->StartPreview();
      join_preview_thread();
      dialog->StopPreview();
    });
  }
};

TEST_F(PreviewTest, ShowsTheCardsPictureInAWindowOfTheChosenSize) {
  for (const bool pal : {true, false}) {
    (pal ? dialog->radioPAL : dialog->radioNTSC)->click();
    (pal ? dialog->radio720 : dialog->radio704)->click();
    window.captions.clear();
    press(dialog->btnPreviewStart);
    EXPECT_FALSE(dialog->radioPAL->isEnabled());
    ASSERT_TRUE(eventually([] {
      const std::lock_guard lock(window.mutex);
      return window.captions.size() >= 3;
    }));
    virtual_card::record_log(true);
    press(dialog->btnPreviewStop);
    join_preview_thread();
    const auto log = virtual_card::log();
    EXPECT_EQ(std::ranges::count(log, zarvo::driver::DISP_IOC_PREVIEW_OFF, &virtual_card::Call::code), 1);
    EXPECT_EQ(std::pair(window.width, window.height), pal ? std::pair(720, 576) : std::pair(704, 480));
    EXPECT_EQ(window.captions[0], "Preview");
    // However late the thread runs, a second holds no more pictures than have their turn in it.
    for (const std::string &caption : {window.captions[1], window.captions[2]}) {
      EXPECT_TRUE(caption.starts_with("Preview FPS : "));
      const int rate = std::atoi(caption.substr(14).c_str());
      EXPECT_TRUE(rate > 0 && rate <= (pal ? 26 : 31)) << rate;
    }
    EXPECT_NE(window.plane, std::vector<Uint8>(window.plane.size(), window.plane[0]));
  }
}

// The card is left alone when it does not do what the operator chose, or when there is no window.
TEST_F(PreviewTest, EndsAtOnceWhenAStartUpCheckFails) {
  const auto expect = [this](auto &&word, auto wrong, auto right, const std::string &printed) {
    word = wrong;
    EXPECT_THAT(printed_by_thread(), testing::MatchesRegex(printed + "\n" + kEnd));
    word = right;
  };
  expect(zv_format, VIDEO_STANDARD_ZV_PAL, VIDEO_STANDARD_ZV_NTSC, "ERROR:format does not match");
  expect(zv_mode, MUX_MODE_ZV_INVALID, MUX_MODE_ZV_9CH,
         "ERROR:zv_SetPreviewMode Error\nERROR:mode does not match!");
  expect(zv_resolution, RESOLUTION_ZV_704, RESOLUTION_ZV_720, "ERROR:resolution does not match!");
  virtual_card::record_log(true);
  qputenv("SDL_VIDEODRIVER", "missing");
  EXPECT_THAT(printed_by_thread(), testing::MatchesRegex("Initial SDL error: .+\n" + kEnd));
  qputenv("SDL_VIDEODRIVER", "dummy");
  expect(window.no_window, true, false, "Unable to set video mode: .*");
  expect(window.no_overlay, true, false, "Unable to create YUV overlay: .*");
  EXPECT_TRUE(virtual_card::log().empty());
}

TEST_F(PreviewTest, StartsAgainAfterTheCardVanished) {
  virtual_card::apply("fail=display/read:ENODEV::2");
  EXPECT_EQ(printed_by_thread(), "Start video thread\nERROR:zv_GetPreviewScreen Error!\n" + kEnd);
  virtual_card::apply("fail=");
  dialog->StartPreview();
  wait_for_pictures(3);
}

// A stop that comes before the thread has looked at its flag is easily lost, and then the next start
// waits for ever; a start that does not wait gives SDL two threads.
TEST_F(PreviewTest, ObeysStartAndStopInQuickSuccession) {
  std::string expected;
  for (int n = 0; n < 50; ++n) expected += "Start video thread\n" + kEnd;
  EXPECT_EQ(printed_by([this] {
              for (int n = 0; n < 50; ++n) {
                press(dialog->btnPreviewStart);
                press(dialog->btnPreviewStop);
              }
              join_preview_thread();
            }),
            expected);
}

// Catches, with ThreadSanitizer: a change of the layout that races with the thread's own. One change a turn:
// a second one would take the lock and hide that the first did not.
TEST_F(PreviewTest, TakesChangesWhileItStartsAndEnds) {
  QAbstractButton *const buttons[] = {dialog->btnSplit4, dialog->btnSetFocus, g_check_handle[3],
                                      dialog->radioPAL,  dialog->radio704,    dialog->radioNTSC,
                                      dialog->radio720};
  for (int n = 0; n < 28; ++n) {
    dialog->StartPreview();
    if (n % 4 != 0) dialog->StopPreview();  // the radio buttons work when it has been stopped
    buttons[n % 7]->click();
    dialog->StopPreview();
  }
}

// Neither a closed window nor a card that lies about lengths and buffers ends the preview. Ctrl-C ends
// the program: it must not become an event that nobody reads.
TEST_F(PreviewTest, GoesOnUntilItIsStopped) {
  dialog->StartPreview();
  wait_for_pictures(1);
  SDL_Event quit = {};
  quit.type = SDL_QUIT;
  ASSERT_EQ(SDL_PushEvent(&quit), 0);
  for (const auto &[index, result] : {std::pair{7u, 100L}, {0u, 0L}, {1u, 0x240000L}})
    virtual_card::queue_preview(index, result);
  wait_for_pictures(5);
  for (const int signal : {SIGINT, SIGTERM, SIGQUIT, SIGALRM}) {
    struct sigaction action;
    sigaction(signal, nullptr, &action);
    EXPECT_EQ(action.sa_handler, SIG_DFL) << signal;
  }
}

TEST_F(PreviewTest, LeavingWaitsForTheThreadBeforeTheCardIsClosed) {
  dialog->StartPreview();
  wait_for_pictures(1);
  EXPECT_EQ(printed_by([this] {
              dialog->ExitDialog();
              dialog.reset();
            }),
            kEnd + "destroy\ndestroy\n");
}

// Rows of the overlay may be longer than rows of the picture; a short picture leaves the rest alone.
TEST_F(PreviewTest, CopiesRowByRowIntoAPaddedOverlay) {
  constexpr std::size_t kWidth = 16, kHeight = 4, kRow = kWidth * 2;
  std::vector<Uint8> picture(kRow * kHeight, 200);
  for (const std::size_t padding : {0u, 16u}) {
    ASSERT_EQ(InitialSDL(static_cast<int>(kWidth + padding), kHeight), 0);
    overlay->w = kWidth;
    const std::size_t pitch = kRow + padding * 2;
    std::fill_n(overlay->pixels[0], pitch * kHeight, Uint8{0});
    UpDataYUVScreen(picture.data(), kRow * 2 + 6);
    for (std::size_t n = 0; n < pitch * kHeight; ++n)
      EXPECT_EQ(window.plane[n], n % pitch < kRow && n < pitch * 2 + 6 ? 200 : 0) << n;
    UpDataYUVScreen(picture.data(), 1 << 30);
    CloseSDL();
  }
}

TEST_F(PreviewTest, KeepsTheOperatorsChoiceWhenTheCardRefusesIt) {
  zv_config.interval = static_cast<ZV_INTERVAL_VALUE>(7);
  const HANDLE card = std::exchange(zv_handle, nullptr);
  EXPECT_EQ(
      printed_by([this] {
        dialog->radioPAL->click();
        dialog->radio704->click();
        dialog->btnSplit9->click();
      }),
      "ERROR:zv_SetVideoStandard Error!\nERROR:zv_zv_SetResolution Error!\nERROR:zv_SetPreviewMode Error!\n");
  zv_handle = card;
  EXPECT_EQ(std::tuple(g_width, g_height, zv_mode), std::tuple(704, 576, MUX_MODE_ZV_9CH));
  EXPECT_EQ(dialog->comboFrameRate->currentText(), "25");
  EXPECT_EQ(std::tuple(dialog->comboFrameRate->count(), +zv_config.interval), std::tuple(15, 0u));
}

// The program tries the card ten times before it uses it; it ends when the card cannot be opened once, or
// when the preview thread cannot be made.
TEST(EndingDeathTest, EndsTheProgramWithoutCardOrThread) {
  testing::GTEST_FLAG(death_test_style) = "threadsafe";
  const std::pair<const char *, const char *> cases[] = {
      {"fail=any/open:EIO", "ERROR:zv_Open Error!, try count = 0\n$"},
      {"fail=any/open:EIO::37", "ERROR:zv_Open Error!, try count = 9\n$"},
      {"fail=any/open:EIO::40", "ERROR:zv_Open Error!\n$"},
      {"fail=any/close:EIO", "ERROR:zv_Close Error!, try count = 0\nERROR:zv_Open Error!, try count = 1\n$"},
      {"fail=any/open:EIO::99", "Create pthread error\n$"},
  };
  for (const auto &[item, printed] : cases)
    EXPECT_EXIT(
        {
          dup2(STDERR_FILENO, STDOUT_FILENO);
          virtual_card::apply(item);
          DemoDialog dialog;
          pthread_attr_t huge;
          pthread_attr_init(&huge);
          pthread_attr_setstacksize(&huge, std::size_t{1} << 46);  // no room for such a thread
          pthread_setattr_default_np(&huge);
          dialog.StartPreview();
        },
        testing::ExitedWithCode(1), printed);
}

}  // namespace
