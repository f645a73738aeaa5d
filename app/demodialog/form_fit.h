#ifndef FORM_FIT_H
#define FORM_FIT_H

#include <QWidget>

/// Gives the dialog's groups and the widgets in them the places of the form or, where a larger font,
/// another style or a longer text needs more room, those places stretched just as far as it takes:
/// by one factor across and one down for the whole dialog. Each group can get no smaller than that.
void fit_form(QWidget &dialog);

#endif
