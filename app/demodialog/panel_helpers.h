/**
 * @file panel_helpers.h
 * What the panels of the dialog have in common: reading numbers and tables, unchecking radio buttons.
 */
#ifndef PANEL_HELPERS_H
#define PANEL_HELPERS_H

#include <QAbstractButton>
#include <QLineEdit>
#include <cstddef>

/// The number typed into an edit, base 10. Text that is no number of 32 bits, also an empty one, is 0;
/// blanks around a number do not matter.
inline int number_in(const QLineEdit *edit) {
  return edit->text().toInt();
}

/// The value that belongs to item `index` of a combo box; `fallback` for an index without a value.
template <typename T, std::size_t N>
T item_value(const T (&table)[N], int index, T fallback) {
  return index >= 0 && static_cast<std::size_t>(index) < N ? table[index] : fallback;
}

/// Unchecks a radio button. An exclusive button refuses to be unchecked, since no button of its group
/// would be chosen then; the exclusiveness is lifted for the moment.
inline void uncheck(QAbstractButton *button) {
  button->setAutoExclusive(false);
  button->setChecked(false);
  button->setAutoExclusive(true);
}

#endif
