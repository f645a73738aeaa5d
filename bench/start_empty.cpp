// The least a Qt dialog costs at its start: an empty one, shown, and out.
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
