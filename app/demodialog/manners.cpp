// How the dialog treats the wheel, Return, the focus, and input that comes while it blocks.
#include "manners.h"

#include <QAbstractItemView>
#include <QApplication>
#include <QComboBox>
#include <QEventLoop>
#include <QKeyEvent>
#include <QSlider>
#include <QTimer>

namespace {

/// Discards user input that goes to any window of the program.
class InputBlock : public QObject {
 public:
  bool eventFilter(QObject *, QEvent *event) override {
    switch (event->type()) {
      case QEvent::MouseButtonPress:
      case QEvent::MouseButtonRelease:
      case QEvent::MouseButtonDblClick:
      case QEvent::KeyPress:
      case QEvent::KeyRelease:
      case QEvent::ShortcutOverride:
      case QEvent::Shortcut:
      case QEvent::Wheel:
      case QEvent::ContextMenu:
      case QEvent::TouchBegin:
      case QEvent::TouchUpdate:
      case QEvent::TouchEnd:
        return true;
      default:
        return false;
    }
  }
};

}  // namespace

Manners::Manners(QWidget &dialog) : QObject(&dialog) {
  for (QWidget *control : dialog.findChildren<QWidget *>()) {
    const bool wheeled =
        qobject_cast<QComboBox *>(control) != nullptr || qobject_cast<QSlider *>(control) != nullptr;
    if (wheeled) control->setFocusPolicy(Qt::StrongFocus);  // the wheel must not give the focus either
    if (wheeled || qobject_cast<QPushButton *>(control) != nullptr) control->installEventFilter(this);
  }
}

bool Manners::eventFilter(QObject *watched, QEvent *event) {
  if (event->type() == QEvent::Wheel) {
    const auto *control = qobject_cast<const QWidget *>(watched);
    if (control == nullptr || control->hasFocus()) return false;
    event->ignore();
    return true;
  }
  auto *combo = qobject_cast<QComboBox *>(watched);
  if (event->type() == QEvent::ChildPolished && combo != nullptr)
    combo->view()->setAccessibleName(combo->accessibleName());
  if (event->type() != QEvent::KeyPress) return false;
  auto *button = qobject_cast<QPushButton *>(watched);
  const auto *key = static_cast<const QKeyEvent *>(event);
  if (button == nullptr || (key->key() != Qt::Key_Return && key->key() != Qt::Key_Enter)) return false;
  // A key that is held down would press Start and Stop in turn.
  if (!key->isAutoRepeat()) button->click();
  return true;
}

void pass_focus(const std::vector<StartStop> &pairs, const QWidget *disabled_next) {
  // The window's focus widget is known also while the program is in the background.
  if (disabled_next->window()->focusWidget() != disabled_next) return;
  for (const auto &[start, stop] : pairs) {
    if (disabled_next != start && disabled_next != stop) continue;
    QPushButton *partner = disabled_next == start ? stop : start;
    if (partner->isEnabled()) partner->setFocus();
  }
}

void paint_all(QWidget &dialog) {
  constexpr int kWindowManagerMs = 200;  // until it has removed the other window and activated the dialog
  QEventLoop loop;
  QTimer::singleShot(kWindowManagerMs, &loop, &QEventLoop::quit);
  loop.exec(QEventLoop::ExcludeUserInputEvents);
  dialog.repaint();
}

void drop_queued_input() {
  InputBlock block;
  QApplication::instance()->installEventFilter(&block);
  QApplication::processEvents();
}
