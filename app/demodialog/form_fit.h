#ifndef FORM_FIT_H
#define FORM_FIT_H

#include <QGroupBox>
#include <vector>

/// Gives the dialog's groups and the widgets in them the places of the form or, where a larger font,
/// another style or a longer text needs more room, those places stretched just as far as it takes:
/// by one factor across and one down for the whole dialog. Each group can get no smaller than that.
class FormFit {
 public:
  /// The dialog as the form has made it, before it is first fitted.
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
