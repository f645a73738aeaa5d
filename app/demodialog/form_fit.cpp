// Stretches the form so that all texts fit, and shrinks it on a low screen.
#include "form_fit.h"

#include <QComboBox>
#include <QFontInfo>
#include <QGroupBox>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QRadioButton>
#include <QScreen>
#include <QStyleOptionGroupBox>
#include <algorithm>
#include <cmath>

namespace {

// Pixels around a text: frame and padding, and the arrow of a combo box.
constexpr int kPadding = 4;
constexpr int kArrow = 22;

constexpr int kLinesOfDesign = 800;
constexpr int kTitleLines = 40;  // of the window manager
constexpr double kLeastScale = 0.4;
constexpr double kScaleStep = 0.01;

struct Factors {
  double across;
  double down;

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

/// Whether a part of the widget has a fixed size: an indicator or the handle of a slider.
bool has_fixed_part(const QWidget *child) {
  return child->inherits("QCheckBox") || child->inherits("QRadioButton") || child->inherits("QSlider");
}

QSize room_for_text(const QWidget *child, double scale) {
  const QFontMetrics metrics(child->font());
  const auto text = [&](const QString &shown) { return metrics.size(Qt::TextSingleLine, shown); };
  const QSize around = QSize(2 * kPadding, kPadding) * scale;
  if (const auto *combo = qobject_cast<const QComboBox *>(child)) {
    QSize widest;
    for (int n = 0; n < combo->count(); ++n) widest = widest.expandedTo(text(combo->itemText(n)));
    return widest + around + QSize(kArrow, 0);
  }
  if (const auto *button = qobject_cast<const QPushButton *>(child)) return text(button->text()) + around;
  if (qobject_cast<const QLineEdit *>(child) != nullptr) return text(QStringLiteral("0000")) + around;
  if (const auto *label = qobject_cast<const QLabel *>(child)) return text(label->text());
  if (const auto *box = qobject_cast<const QAbstractButton *>(child)) {
    QStyleOptionButton option;
    option.initFrom(box);
    option.text = box->text();  // with a text there is a gap beside the indicator
    const auto contents =
        qobject_cast<const QRadioButton *>(child) != nullptr ? QStyle::CT_RadioButton : QStyle::CT_CheckBox;
    const QSize shown = text(box->text());
    const QSize whole = box->style()->sizeFromContents(contents, &option, shown, box);
    return scale < 1 ? QSize(whole.width(), shown.height()) : whole;
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

FormFit::FormFit(QWidget &dialog)
    : dialog_(dialog),
      size_(dialog.size()),
      grid_(static_cast<QGridLayout &>(*dialog.layout())),
      margin_(grid_.contentsMargins().left()),
      spacing_(grid_.spacing()) {
  for (int row = 0; row < grid_.rowCount(); ++row) row_heights_.push_back(grid_.rowMinimumHeight(row));
  for (QGroupBox *box : dialog.findChildren<QGroupBox *>(QString(), Qt::FindDirectChildrenOnly)) {
    Group &group = groups_.emplace_back(Group{box, box->minimumSize(), {}});
    for (QWidget *child : box->findChildren<QWidget *>(QString(), Qt::FindDirectChildrenOnly))
      group.children.push_back({child, child->geometry()});
  }
}

void FormFit::fit() {
  Factors factors{scale_, scale_};
  for (const Group &group : groups_) {
    const QSize title(0, title_bottom(group.box));
    for (const auto &[widget, place] : group.children) {
      factors.make_room(room_for_text(widget, scale_), place.size());
      factors.make_room(title, {1, place.y()});
    }
  }
  for (const Group &group : groups_) {
    for (const auto &[widget, place] : group.children) {
      const QRect now = factors.stretched(place);
      // On a low screen the fixed part may be higher than its place.
      const int lacking = has_fixed_part(widget) ? widget->sizeHint().height() - now.height() : 0;
      widget->setGeometry(lacking > 0 ? now.adjusted(0, -lacking / 2, 0, lacking - lacking / 2) : now);
    }
    group.box->setMinimumSize(factors.stretched(group.size));
  }
  const auto shrunk = [this](int length) { return static_cast<int>(std::lround(length * scale_)); };
  for (int row = 0; row < grid_.rowCount(); ++row)
    grid_.setRowMinimumHeight(row, shrunk(row_heights_[static_cast<std::size_t>(row)]));
  const int margin = shrunk(margin_);
  grid_.setContentsMargins(margin, margin, margin, margin);
  grid_.setSpacing(shrunk(spacing_));
}

void FormFit::shrink_into(QSize room) {
  const QFont font = dialog_.font();
  while (least_size().expandedTo(room) != room && scale_ > kLeastScale) {
    scale_ -= kScaleStep;
    QFont smaller = font;
    smaller.setPointSizeF(QFontInfo(font).pointSizeF() * scale_);
    dialog_.setFont(smaller);
    fit();
  }
}

QSize FormFit::least_size() const {
  return (size_ * scale_).expandedTo(dialog_.minimumSizeHint());
}

QSize FormFit::room_on(const QScreen &screen) {
  if (screen.size().height() >= kLinesOfDesign) return {QWIDGETSIZE_MAX, QWIDGETSIZE_MAX};
  return screen.availableSize() - QSize(0, kTitleLines);
}
