// The least a Qt dialog costs at its start: an empty one, shown, and out. With an argument Qt loads the font
// as well, as it must for the first text of any dialog. Beside it bench_start times the demo program's dialog
// on the virtual card.
#include <QApplication>
#include <QDialog>
#include <QFontMetrics>
#include <QTimer>
#include <cstdlib>

int main(int argc, char **argv) {
  const QApplication application(argc, argv);
  QDialog dialog;
  dialog.show();
  if (argc > 1) QFontMetrics(dialog.font()).horizontalAdvance(QStringLiteral("text"));
  QTimer::singleShot(0, &application, [] { std::_Exit(0); });
  return QApplication::exec();
}
