// Entry point of the demo application.
#include <QApplication>
#include <QStyle>
#include <clocale>
#include <csignal>
#include <cstdio>

#include "demodialog/demodialog.h"
#include "sdl.h"

int main(int argc, char **argv) {
  // Write each line at once, also into a pipe: scripts read the lines while the program runs.
  std::setvbuf(stdout, nullptr, _IOLBF, 0);
  // Keep recording when the reader of the lines has gone, or when a file reaches its size limit.
  std::signal(SIGPIPE, SIG_IGN);
  std::signal(SIGXFSZ, SIG_IGN);
  set_overlay_environment();  // before Qt starts threads
  const QApplication application(argc, argv);
  std::setlocale(LC_NUMERIC, "C");  // printed numbers must not depend on the locale
  // Two groups of the form have black text. Use the light palette of the style, since a dark theme would make
  // that text unreadable.
  QApplication::setPalette(QApplication::style()->standardPalette());
  DemoDialog *dialog = new DemoDialog;
  dialog->show();
  QApplication::exec();
  dialog->ExitDialog();
  delete dialog;
  return 0;
}
