#include <gmock/gmock.h>

#include <QApplication>

// A test that ends through exit() does not destroy the application object, so memory that fontconfig
// allocated is not freed. The dialog does not leak it: ignore it. Only a build with LeakSanitizer calls these
// two functions.
extern "C" {
const char *__lsan_default_suppressions() {
  return "leak:libfontconfig.so";
}
const char *__lsan_default_options() {
  return "print_suppressions=0";
}
}

int main(int argc, char **argv) {
  if (!qEnvironmentVariableIsSet("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
  qputenv("SDL_VIDEODRIVER", "dummy");
  testing::InitGoogleMock(&argc, argv);
  const QApplication application(argc, argv);
  return RUN_ALL_TESTS();
}
