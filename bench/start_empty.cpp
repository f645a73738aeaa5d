// Shows an empty Qt dialog and ends: the least time that a program with a dialog needs to start.
#include <QApplication>
#include <QDialog>
#include <QTimer>
#include <cstdlib>

int main(int argc, char **argv) {
  const QApplication application(argc, argv);
  QDialog dialog;
  dialog.show();
  QTimer::singleShot(0, &application, [] { std::_Exit(0); });
  return QApplication::exec();
}
