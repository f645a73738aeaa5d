// The least a Qt dialog costs at its start: an empty one, shown, and out. Beside it bench_start times the
// demo program's dialog on the virtual card.
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
