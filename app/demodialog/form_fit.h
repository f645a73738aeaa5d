/**
 * @file form_fit.h
 * Stretches the form so that all texts fit, and shrinks it on a low screen.
 */
#ifndef FORM_FIT_H
#define FORM_FIT_H

#include <QGridLayout>
#include <QGroupBox>
#include <vector>

class QScreen;

/// Places the dialog's groups and the widgets in them as in the form. If a font, a style or a text needs more
/// room, stretches all places by two factors, one for widths and one for heights, which are only as large as
/// necessary. The result is the minimum size of each group.
class FormFit {
 public:
  /// Takes the places from the dialog. Create it after setupUi() and before the first fit().
  explicit FormFit(QWidget &dialog);
  void fit();

  /// Shrinks font and places by the largest factor, at most 1, at which the dialog fits into the room. Stops
  /// at 0.4: smaller texts cannot be read.
  void shrink_into(QSize room);

  /// Returns the form's size, shrunk with the places, or larger if its contents need more room.
  QSize least_size() const;

  /// Returns the room for the dialog on a screen, without the window manager's title. A screen of 800 lines
  /// or more sets no limit: the form was designed for such screens.
  static QSize room_on(const QScreen &screen);

 private:
  struct Child {
    QWidget *widget;
    QRect place;
  };
  struct Group {
    QGroupBox *box;
    QSize size;
    std::vector<Child> children;
  };
  QWidget &dialog_;
  const QSize size_;
  QGridLayout &grid_;
  std::vector<int> row_heights_;
  const int margin_;
  const int spacing_;
  std::vector<Group> groups_;
  double scale_ = 1;
};

#endif
