// The demo program's start, up to its dialog being shown, and out.
#include <QApplication>
#include <QTimer>
#include <cstdlib>

#include "demodialog.h"

int main(int argc, char **argv) {
  const QApplication application(argc, argv);
  DemoDialog dialog;
  dialog.show();
  // Leaving by _Exit keeps the one-second pause of ExitDialog out of the figure.
  QTimer::singleShot(0, &application, [] { std::_Exit(0); });
  return QApplication::exec();
}
