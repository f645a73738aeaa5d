// What an operator expects of any dialog: wheel, focus, and texts for a screen reader.
#include <QAbstractItemView>
#include <QAccessible>
#include <QApplication>
#include <QTest>
#include <QWheelEvent>
#include <functional>
#include <set>

#include "dialog_fixture.h"

namespace {

void turn_wheel(QWidget *control) {
  const QPointF middle(control->rect().center());
  QWheelEvent notch(middle, control->mapToGlobal(middle), {}, {0, -120}, {}, {}, Qt::NoScrollPhase, false);
  QApplication::sendEvent(control, &notch);
}

TEST_F(DialogTest, TheWheelChangesOnlyWhatHasTheFocus) {
  dialog->activateWindow();
  ASSERT_TRUE(QTest::qWaitForWindowActive(dialog.get()));
  for (QWidget *control : dialog->findChildren<QWidget *>()) {
    const bool combo = qobject_cast<QComboBox *>(control) != nullptr;
    if (!combo && qobject_cast<QSlider *>(control) == nullptr) continue;
    const char *const value = combo ? "currentIndex" : "value";
    const QVariant before = control->property(value);
    dialog->edtFocus->setFocus();
    turn_wheel(control);
    EXPECT_EQ(control->property(value), before) << control->objectName().toStdString();
    control->setFocus();
    turn_wheel(control);
    EXPECT_NE(control->property(value), before) << control->objectName().toStdString();
  }
}

TEST_F(DialogTest, StartAndStopPassTheFocusToEachOther) {
  const struct {
    QPushButton *start, *stop;
    UI_STATUS started, stopped;
  } rows[] = {{dialog->btnPreviewStart, dialog->btnPreviewStop, PREVIEW_START, PREVIEW_STOP},
              {dialog->btnRecordStart, dialog->btnRecordStop, RECORD_START, RECORD_STOP},
              {dialog->btnMotionStart, dialog->btnMotionStop, MOTION_START, MOTION_STOP}};
  dialog->btnRecordStart->setEnabled(true);
  for (const auto &row : rows) {
    row.start->setFocus();
    dialog->UpdateUI(row.started);
    EXPECT_EQ(dialog->focusWidget(), row.stop);
    dialog->UpdateUI(row.stopped);
    EXPECT_EQ(dialog->focusWidget(), row.start);
    dialog->edtFocus->setFocus();
    dialog->UpdateUI(row.started);
    EXPECT_EQ(dialog->focusWidget(), dialog->edtFocus);
  }
}

// Catches: a control that is left out of the texts; a label that leads to the edit of another panel; two
// "Set" that sound the same.
TEST_F(DialogTest, AScreenReaderFindsANameForEachControl) {
  std::set<QString> heard;
  const std::function<void(QAccessibleInterface *)> walk = [&](QAccessibleInterface *node) {
    const auto *widget = qobject_cast<const QWidget *>(node->object());
    // On Linux the name of a combo box is its choice; the label that leads to it names it.
    const QString name =
        node->role() == QAccessible::ComboBox ? widget->accessibleName() : node->text(QAccessible::Name);
    const std::string where = node->object() ? node->object()->objectName().toStdString() : "";
    EXPECT_FALSE(name.isEmpty()) << where << " role " << node->role();
    if (const auto *label = qobject_cast<const QLabel *>(widget)) {
      ASSERT_TRUE(label->buddy()) << where;
      EXPECT_EQ(label->buddy()->parent(), label->parent()) << where;
    } else if (widget != nullptr && widget->focusPolicy() != Qt::NoFocus && !widget->isWindow() &&
               node->role() != QAccessible::List) {
      EXPECT_TRUE(heard.insert(QString::number(node->role()) + name).second) << where;
      EXPECT_FALSE(node->text(QAccessible::Description).isEmpty()) << where;
      EXPECT_EQ(widget->whatsThis().section(". ", 1).right(1), ".") << where;
    }
    if (node->role() == QAccessible::List) return;  // its items have their texts
    for (int n = 0; n < node->childCount(); ++n) walk(node->child(n));
  };
  for (const QComboBox *combo : dialog->findChildren<QComboBox *>())
    combo->view()->window()->ensurePolished();
  walk(QAccessible::queryAccessibleInterface(dialog.get()));
  EXPECT_EQ(heard.size(), 89u);
  const auto *hue = QAccessible::queryAccessibleInterface(dialog->edtHue);
  EXPECT_EQ(hue->text(QAccessible::Name) + ", " + hue->text(QAccessible::Description),
            "Hue, degrees, -180 to 180");
}

}  // namespace
