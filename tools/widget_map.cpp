// Prints where the widgets of the dialog are, for an operator that clicks them from outside: a line
// "widget NAME X Y" for the clickable point of each, in pixels of the dialog's window. Run it on the
// display of the program, so that fonts and style are the same.
#include <QAbstractButton>
#include <QApplication>
#include <QStyle>
#include <QStyleOptionButton>
#include <cstdio>

#include "demodialog.h"

namespace {

// A click in the middle of a radio button or check box misses it when the widget is wider than its text.
QPoint clickable_point(const QWidget &widget) {
  const bool box = widget.inherits("QRadioButton") || widget.inherits("QCheckBox");
  return box ? QPoint(9, widget.height() / 2) : widget.rect().center();
}

}  // namespace

int main(int argc, char **argv) {
  QApplication application(argc, argv);
  DemoDialog dialog;
  dialog.show();
  QApplication::processEvents();
  for (const QWidget *widget : dialog.findChildren<QWidget *>()) {
    if (widget->objectName().isEmpty() || widget->objectName().startsWith("qt_")) continue;
    const QPoint point = widget->mapTo(&dialog, clickable_point(*widget));
    std::printf("widget %s %d %d\n", qPrintable(widget->objectName()), point.x(), point.y());
  }
  dialog.ExitDialog();
  return 0;
}
