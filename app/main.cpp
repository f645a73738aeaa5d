#include <QApplication>
#include <QStyle>
#include <clocale>
#include <csignal>
#include <cstdio>

#include "demodialog/demodialog.h"
#include "sdl.h"

int main(int argc, char **argv) {
  // The diagnostics are read through pipes, too: each line is to be seen at once.
  std::setvbuf(stdout, nullptr, _IOLBF, 0);
  // A recording outlives whoever reads the lines, and a file that reaches its size limit.
  std::signal(SIGPIPE, SIG_IGN);
  std::signal(SIGXFSZ, SIG_IGN);
  set_overlay_environment();  // before Qt starts its threads
  const QApplication application(argc, argv);
  std::setlocale(LC_NUMERIC, "C");  // the lines are the same in every country
  // Two groups of the form are black on the window's colour, which a dark theme would make black as well.
  QApplication::setPalette(QApplication::style()->standardPalette());
  DemoDialog *dialog = new DemoDialog;
  dialog->show();
  QApplication::exec();
  dialog->ExitDialog();
  delete dialog;
  return 0;
}
