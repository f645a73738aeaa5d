#include <gmock/gmock.h>

#include <QApplication>

// A test that ends through exit() leaves the application object standing, and with it what fontconfig has
// handed out: no leak of the dialog's. Only a build with LeakSanitizer asks for these.
extern "C" {
const char *__lsan_default_suppressions() {
  return "leak:libfontconfig.so";
}
const char *__lsan_default_options() {
  return "print_suppressions=0";
}
}

int main(int argc, char **argv) {
  qputenv("QT_QPA_PLATFORM", "offscreen");
  qputenv("SDL_VIDEODRIVER", "dummy");
  testing::InitGoogleMock(&argc, argv);
  const QApplication application(argc, argv);
  return RUN_ALL_TESTS();
}
