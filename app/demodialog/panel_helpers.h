/**
 * @file panel_helpers.h
 * Helpers that several panels use: reading numbers and tables, unchecking radio buttons.
 */
#ifndef PANEL_HELPERS_H
#define PANEL_HELPERS_H

#include <QAbstractButton>
#include <QLineEdit>
#include <cstddef>

/// Returns the decimal number in an edit; ignores blanks around it. A text that is empty or not a number of
/// 32 bits counts as 0.
inline int number_in(const QLineEdit *edit) {
  return edit->text().toInt();
}

/// Returns the value of item `index` of a combo box, or `fallback` for an index without a value.
template <typename T, std::size_t N>
T item_value(const T (&table)[N], int index, T fallback) {
  return index >= 0 && static_cast<std::size_t>(index) < N ? table[index] : fallback;
}

/// Unchecks a radio button. Qt refuses to uncheck an exclusive button, so the button is not exclusive for
/// that moment.
inline void uncheck(QAbstractButton *button) {
  button->setAutoExclusive(false);
  button->setChecked(false);
  button->setAutoExclusive(true);
}

#endif
