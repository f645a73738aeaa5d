/**
 * @file form_fit.h
 * Stretches the form so that all texts fit.
 */
#ifndef FORM_FIT_H
#define FORM_FIT_H

#include <QGroupBox>
#include <vector>

/// Places the dialog's groups and the widgets in them as in the form. If a font, a style or a text needs more
/// room, stretches all places by two factors, one for widths and one for heights, which are only as large as
/// necessary. The result is the minimum size of each group.
class FormFit {
 public:
  /// Takes the places from the dialog. Create it after setupUi() and before the first fit().
  explicit FormFit(const QWidget &dialog);
  void fit() const;

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
  std::vector<Group> groups_;
};

#endif
