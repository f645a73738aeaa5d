/**
 * @file manners.h
 * How the dialog treats the wheel, Return, the focus, and input that comes while it blocks.
 */
#ifndef MANNERS_H
#define MANNERS_H

#include <QObject>
#include <QPushButton>
#include <vector>

/// Watches the controls of the dialog:
/// - The wheel changes a combo box or slider only if it has the focus. Otherwise an operator who scrolls
///   changes settings without noticing.
/// - The list of a combo box gets the accessible name of the combo box. Qt creates the list when it is first
///   needed.
/// - Return presses the push button that has the focus. The buttons are not auto-default: Return in an edit
///   would press the next one.
class Manners : public QObject {
 public:
  /// Watches the controls that exist now.
  explicit Manners(QWidget &dialog);

  bool eventFilter(QObject *watched, QEvent *event) override;
};

/// The buttons that start and stop an activity.
struct StartStop {
  QPushButton *start;
  QPushButton *stop;
};

/// Moves the focus from a button that is about to be disabled to its partner. Call it when the partner is
/// enabled. Otherwise Qt moves the focus to the next control of the tab order, and the next Space presses
/// that one.
void pass_focus(const std::vector<StartStop> &pairs, const QWidget *disabled_next);

/// Paints the dialog as it is now; call it before the event loop blocks. A window that has just been closed
/// leaves its picture on the dialog until the window manager has removed it: this function waits a moment for
/// that. Clicks and keys stay queued.
void paint_all(QWidget &dialog);

/// Discards the clicks and keys that came while the event loop was blocked: the operator saw no reaction to
/// them, and does not expect one later. A request to close the window is kept.
void drop_queued_input();

#endif
