// Stretches the form so that all texts fit.
#include "form_fit.h"

#include <QComboBox>
#include <QGroupBox>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QRadioButton>
#include <QStyleOptionGroupBox>
#include <algorithm>
#include <cmath>

namespace {

// Pixels around a text: frame and padding, and the arrow of a combo box.
constexpr int kPadding = 4;
constexpr int kArrow = 22;

struct Factors {
  double across = 1;
  double down = 1;

  void make_room(QSize needed, QSize given) {
    across = std::max(across, static_cast<double>(needed.width()) / given.width());
    down = std::max(down, static_cast<double>(needed.height()) / given.height());
  }
  QSize stretched(QSize size) const {
    return {static_cast<int>(std::ceil(size.width() * across)),
            static_cast<int>(std::ceil(size.height() * down))};
  }
  QRect stretched(QRect rect) const {
    const auto edge = [](int at, double factor) { return static_cast<int>(std::lround(at * factor)); };
    const QPoint corner(edge(rect.x(), across), edge(rect.y(), down));
    return {corner,
            QPoint(edge(rect.x() + rect.width(), across) - 1, edge(rect.y() + rect.height(), down) - 1)};
  }
};

QSize room_for_text(const QWidget *child) {
  const QFontMetrics metrics(child->font());
  const auto text = [&](const QString &shown) { return metrics.size(Qt::TextSingleLine, shown); };
  constexpr QSize kAround(2 * kPadding, kPadding);
  if (const auto *combo = qobject_cast<const QComboBox *>(child)) {
    QSize widest;
    for (int n = 0; n < combo->count(); ++n) widest = widest.expandedTo(text(combo->itemText(n)));
    return widest + kAround + QSize(kArrow, 0);
  }
  if (const auto *button = qobject_cast<const QPushButton *>(child)) return text(button->text()) + kAround;
  if (qobject_cast<const QLineEdit *>(child) != nullptr) return text(QStringLiteral("0000")) + kAround;
  if (const auto *label = qobject_cast<const QLabel *>(child)) return text(label->text());
  if (const auto *box = qobject_cast<const QAbstractButton *>(child)) {
    QStyleOptionButton option;
    option.initFrom(box);
    const auto contents =
        qobject_cast<const QRadioButton *>(child) != nullptr ? QStyle::CT_RadioButton : QStyle::CT_CheckBox;
    return box->style()->sizeFromContents(contents, &option, text(box->text()), box);
  }
  return {};
}

int title_bottom(const QGroupBox *group) {
  QStyleOptionGroupBox option;
  option.initFrom(group);
  option.text = QStringLiteral("T");  // any title will do: only the height matters
  option.subControls = QStyle::SC_GroupBoxLabel;
  const QStyle *style = group->style();
  return style->subControlRect(QStyle::CC_GroupBox, &option, QStyle::SC_GroupBoxLabel, group).bottom();
}

}  // namespace

FormFit::FormFit(const QWidget &dialog) {
  for (QGroupBox *box : dialog.findChildren<QGroupBox *>(QString(), Qt::FindDirectChildrenOnly)) {
    Group &group = groups_.emplace_back(Group{box, box->minimumSize(), {}});
    for (QWidget *child : box->findChildren<QWidget *>(QString(), Qt::FindDirectChildrenOnly))
      group.children.push_back({child, child->geometry()});
  }
}

void FormFit::fit() const {
  Factors factors;
  for (const Group &group : groups_) {
    const QSize title(0, title_bottom(group.box));
    for (const auto &[widget, place] : group.children) {
      factors.make_room(room_for_text(widget), place.size());
      factors.make_room(title, {1, place.y()});
    }
  }
  for (const Group &group : groups_) {
    for (const auto &[widget, place] : group.children) widget->setGeometry(factors.stretched(place));
    group.box->setMinimumSize(factors.stretched(group.size));
  }
}
