// The preview thread and its controls, and the dialog's way of opening and leaving the card. SDL's calls
// pass through this program on their way, so that a test sees what reached the window.
#include <SDL.h>
#include <dlfcn.h>

#include <QTest>
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

namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::StartsWith;

enum class Broken { nothing, initialisation, window, overlay };

struct Window {
  Broken broken = Broken::nothing;
  int padding = 0;  // pixels that each row of the overlay has in excess
  std::atomic<int> pictures = 0;
  std::atomic<int> open = 0, most_open = 0;
  std::mutex mutex;  // guards what follows
  std::vector<std::string> captions;
  int width = 0, height = 0;
  std::vector<Uint8> plane;
};
Window window;

template <typename Function>
Function real(Function, const char *name) {
  return reinterpret_cast<Function>(dlsym(RTLD_NEXT, name));
}

}  // namespace

extern "C" {

int SDL_Init(Uint32 flags) {
  if (window.broken == Broken::initialisation) return -1;
  window.most_open = std::max(++window.open, window.most_open.load());
  return real(&SDL_Init, "SDL_Init")(flags);
}

void SDL_Quit() {
  if (SDL_WasInit(SDL_INIT_VIDEO) != 0) --window.open;
  real(&SDL_Quit, "SDL_Quit")();
}

SDL_Surface *SDL_SetVideoMode(int width, int height, int bits, Uint32 flags) {
  if (window.broken == Broken::window) return nullptr;
  const std::lock_guard lock(window.mutex);
  window.width = width;
  window.height = height;
  return real(&SDL_SetVideoMode, "SDL_SetVideoMode")(width, height, bits, flags);
}

SDL_Overlay *SDL_CreateYUVOverlay(int width, int height, Uint32 format, SDL_Surface *surface) {
  if (window.broken == Broken::overlay) return nullptr;
  const auto create = real(&SDL_CreateYUVOverlay, "SDL_CreateYUVOverlay");
  SDL_Overlay *overlay = create(width + window.padding, height, format, surface);
  overlay->w = width;
  return overlay;
}

int SDL_DisplayYUVOverlay(SDL_Overlay *overlay, SDL_Rect *) {
  const std::lock_guard lock(window.mutex);
  window.plane.assign(overlay->pixels[0], overlay->pixels[0] + overlay->pitches[0] * overlay->h);
  ++window.pictures;
  return 0;
}

void SDL_WM_SetCaption(const char *title, const char *) {
  const std::lock_guard lock(window.mutex);
  window.captions.emplace_back(title);
}
}

namespace {

class PreviewTest : public DialogTest {
 protected:
  void SetUp() override {
    window.broken = Broken::nothing;
    window.padding = 0;
    window.captions.clear();
    window.pictures = window.most_open = 0;
    DialogTest::SetUp();
  }
  void press(QPushButton *button) { QTest::mouseClick(button, Qt::LeftButton); }
  void wait_for_pictures(int number) {
    const int before = window.pictures;
    ASSERT_TRUE(wait_until([&] { return window.pictures >= before + number; }));
  }
  // What the thread prints when it is started and ends by itself.
  std::string printed_by_thread() {
    return printed_by([this] {
      dialog->StartPreview();
      join_preview_thread();
      dialog->StopPreview();
    });
  }
  static bool card_preview_switched_on() {
    for (const auto &command : virtual_card::log())
      if (command.code == zarvo::driver::DISP_IOC_PREVIEW_ON) return true;
    return false;
  }
};

TEST_F(PreviewTest, ShowsTheCardsPictureInAWindowOfTheChosenSize) {
  struct Choice {
    QRadioButton *standard, *width;
    int pixels, lines;
  };
  const Choice choices[] = {{dialog->radioNTSC, dialog->radio704, 704, 480},
                            {dialog->radioPAL, dialog->radio720, 720, 576}};
  for (const Choice &choice : choices) {
    choice.standard->click();
    choice.width->click();
    press(dialog->btnSplit16);
    window.captions.clear();
    press(dialog->btnPreviewStart);
    EXPECT_FALSE(dialog->radioPAL->isEnabled());
    wait_for_pictures(2);
    ASSERT_TRUE(wait_until([] {
      const std::lock_guard lock(window.mutex);
      return window.captions.size() >= 2;
    }));
    press(dialog->btnPreviewStop);
    join_preview_thread();
    EXPECT_TRUE(dialog->radioPAL->isEnabled());
    EXPECT_EQ(window.width, choice.pixels);
    EXPECT_EQ(window.height, choice.lines);
    EXPECT_EQ(window.captions[0], "Preview");
    EXPECT_THAT(window.captions[1], testing::MatchesRegex("Preview FPS : [1-9][0-9]*"));
    // Sixteen cameras fill the picture with more than one colour.
    EXPECT_NE(std::adjacent_find(window.plane.begin(), window.plane.end() - 4, std::not_equal_to<>()),
              window.plane.end() - 4);
    EXPECT_EQ(SDL_WasInit(0), 0u);
  }
}

// The card is left alone when it does not do what the operator chose, or when there is no window.
TEST_F(PreviewTest, EndsAtOnceWhenAStartUpCheckFails) {
  const std::string end = "Exit video thread\n";
  zv_format = VIDEO_STANDARD_ZV_PAL;
  EXPECT_EQ(printed_by_thread(), "ERROR:format does not match\n" + end);
  zv_format = VIDEO_STANDARD_ZV_NTSC;
  zv_mode = MUX_MODE_ZV_INVALID;
  EXPECT_EQ(printed_by_thread(), "ERROR:zv_SetPreviewMode Error\nERROR:mode does not match!\n" + end);
  zv_mode = MUX_MODE_ZV_9CH;
  zv_resolution = RESOLUTION_ZV_704;
  EXPECT_EQ(printed_by_thread(), "ERROR:resolution does not match!\n" + end);
  zv_resolution = RESOLUTION_ZV_720;

  virtual_card::record_log(true);
  window.broken = Broken::initialisation;
  EXPECT_THAT(printed_by_thread(), testing::MatchesRegex("Initial SDL error: .*\n" + end));
  window.broken = Broken::window;
  EXPECT_THAT(printed_by_thread(), testing::MatchesRegex("Unable to set video mode: .*\n" + end));
  window.broken = Broken::overlay;
  EXPECT_THAT(printed_by_thread(), testing::MatchesRegex("Unable to create YUV overlay: .*\n" + end));
  EXPECT_FALSE(card_preview_switched_on());
  EXPECT_EQ(SDL_WasInit(0), 0u);
}

TEST_F(PreviewTest, StartsAgainAfterTheCardVanished) {
  virtual_card::inject({.operation = virtual_card::Operation::read,
                        .countdown = 3,
                        .for_good = true,
                        .device = virtual_card::Device::display});
  EXPECT_EQ(printed_by_thread(), "Start video thread\nERROR:zv_GetPreviewScreen Error!\nExit video thread\n");
  EXPECT_EQ(SDL_WasInit(0), 0u);
  virtual_card::clear_fault();
  dialog->StartPreview();
  wait_for_pictures(3);
}

// A stop that comes before the thread has looked at its flag is easily lost, and then the next start
// waits for ever; a start that does not wait gives SDL two threads.
TEST_F(PreviewTest, ObeysStartAndStopInQuickSuccession) {
  const std::string printed = printed_by([this] {
    for (int n = 0; n < 50; ++n) {
      press(dialog->btnPreviewStart);
      press(dialog->btnPreviewStop);
    }
    join_preview_thread();
  });
  int ends = 0;
  for (std::size_t at = 0; (at = printed.find("Exit video thread\n", at)) != std::string::npos; ++at) ++ends;
  EXPECT_EQ(ends, 50);
  EXPECT_EQ(window.most_open, 1);
  EXPECT_THAT(printed, testing::Not(HasSubstr("ERROR")));
}

TEST_F(PreviewTest, GoesOnWhenTheWindowManagerClosesItsWindow) {
  dialog->StartPreview();
  wait_for_pictures(1);
  SDL_Event quit = {};
  quit.type = SDL_QUIT;
  ASSERT_EQ(SDL_PushEvent(&quit), 0);
  wait_for_pictures(5);
  // Ctrl-C must end the program and not become such an event.
  for (const int signal : {SIGINT, SIGTERM}) {
    struct sigaction action;
    sigaction(signal, nullptr, &action);
    EXPECT_EQ(action.sa_handler, SIG_DFL) << signal;
  }
}

TEST_F(PreviewTest, LeavingWaitsForTheThreadBeforeTheCardIsClosed) {
  dialog->StartPreview();
  wait_for_pictures(1);
  EXPECT_THAT(printed_by([this] {
                dialog->ExitDialog();
                dialog.reset();
              }),
              testing::MatchesRegex("(Start video thread\n)?Exit video thread\ndestroy\ndestroy\n"));
  EXPECT_EQ(SDL_WasInit(0), 0u);
}

TEST_F(PreviewTest, BelievesNoLengthAndNoBufferOfTheCard) {
  dialog->StartPreview();
  wait_for_pictures(1);
  for (const auto &[index, result] : {std::pair{7u, 100L}, {0u, 0L}, {1u, 0x240000L}, {2u, 0x7FFFFFFFL}})
    virtual_card::queue_preview(index, result);
  wait_for_pictures(5);
}

// Rows of the overlay may be longer than rows of the picture; a short picture leaves the rest alone.
TEST_F(PreviewTest, CopiesRowByRowIntoAPaddedOverlay) {
  constexpr int kWidth = 16, kHeight = 4;
  std::vector<Uint8> picture(kWidth * 2 * kHeight);
  for (std::size_t n = 0; n < picture.size(); ++n) picture[n] = static_cast<Uint8>(n + 1);
  for (const int padding : {0, 16}) {
    window.padding = padding;
    ASSERT_EQ(InitialSDL(kWidth, kHeight), 0);
    UpDataYUVScreen(picture.data(), kWidth * 2 * 2 + 6);
    const std::size_t pitch = static_cast<std::size_t>(kWidth + padding) * 2;
    for (const int row : {0, 1}) EXPECT_EQ(window.plane[pitch * row + 31], picture[32 * row + 31]);
    EXPECT_EQ(window.plane[pitch * 2 + 5], picture[69]);
    EXPECT_NE(window.plane[pitch * 2 + 6], picture[70]);
    SDL_Event quit = {};
    quit.type = SDL_QUIT;
    SDL_PushEvent(&quit);
    EXPECT_EQ(CheckExitEvent(), 1);
    EXPECT_EQ(CheckExitEvent(), 0);
    CloseSDL();
  }
}

TEST_F(PreviewTest, KeepsTheOperatorsChoiceWhenTheCardRefusesIt) {
  EXPECT_EQ(printed_by([this] { press(dialog->btnSplit6); }), "");
  EXPECT_EQ(zv_GetPreviewMode(zv_handle), 2u);
  dialog->comboFrameRate->setCurrentIndex(7);
  zv_config.interval = static_cast<ZV_INTERVAL_VALUE>(7);
  dialog->radioPAL->click();
  EXPECT_EQ(dialog->comboFrameRate->count(), 15);
  EXPECT_EQ(dialog->comboFrameRate->currentText(), "25");
  EXPECT_EQ(zv_config.interval, 0);
  EXPECT_EQ(zv_GetVideoStandard(zv_handle), 1u);
  const HANDLE card = std::exchange(zv_handle, nullptr);
  EXPECT_EQ(
      printed_by([this] {
        dialog->radioNTSC->click();
        dialog->radio704->click();
        dialog->btnSplit9->click();
      }),
      "ERROR:zv_SetVideoStandard Error!\nERROR:zv_zv_SetResolution Error!\nERROR:zv_SetPreviewMode Error!\n");
  zv_handle = card;
  EXPECT_EQ(zv_format, VIDEO_STANDARD_ZV_NTSC);
  EXPECT_EQ(g_height, 480);
  EXPECT_EQ(g_width, 704);
  EXPECT_EQ(zv_mode, MUX_MODE_ZV_9CH);
}

// The program tries the card ten times before it uses it, and ends when it cannot be opened once.
TEST(OpenCardDeathTest, EndsTheProgramWhenTheCardCannotBeOpened) {
  testing::GTEST_FLAG(death_test_style) = "threadsafe";
  struct Case {
    virtual_card::Operation operation;
    int countdown;
    const char *printed;
  };
  const Case cases[] = {
      {virtual_card::Operation::open, 1, "ERROR:zv_Open Error!, try count = 0\n$"},
      {virtual_card::Operation::open, 4 * 9 + 2, "ERROR:zv_Open Error!, try count = 9\n$"},
      {virtual_card::Operation::open, 4 * 10 + 1, "ERROR:zv_Open Error!\n$"},
      {virtual_card::Operation::close, 1,
       "ERROR:zv_Close Error!, try count = 0\nERROR:zv_Open Error!, try count = 1\n$"},
  };
  for (const Case &expected : cases)
    EXPECT_EXIT(
        {
          dup2(STDERR_FILENO, STDOUT_FILENO);
          virtual_card::reset();
          virtual_card::inject(
              {.operation = expected.operation, .countdown = expected.countdown, .for_good = true});
          const DemoDialog dialog;
        },
        testing::ExitedWithCode(1), expected.printed);
}

}  // namespace
