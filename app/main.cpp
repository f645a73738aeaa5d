#include <QApplication>
#include <cstdio>

#include "demodialog/demodialog.h"
#include "sdl.h"

int main(int argc, char **argv) {
  // The diagnostics are read through pipes, too: each line is to be seen at once.
  std::setvbuf(stdout, nullptr, _IOLBF, 0);
  set_overlay_environment();  // before Qt starts its threads
  const QApplication application(argc, argv);
  DemoDialog *dialog = new DemoDialog;
  dialog->show();
  QApplication::exec();
  dialog->ExitDialog();
  delete dialog;
  return 0;
}
