/**
 * @file light_palette.h
 * The colours of the program.
 */
#ifndef LIGHT_PALETTE_H
#define LIGHT_PALETTE_H

#include <QPalette>

/// Returns the style's palette if its ground is light, otherwise a light palette: the form has texts in fixed
/// colours that are unreadable on the ground of a dark theme. Selected text has a dark ground in both.
QPalette light_palette(const QPalette &of_style);

#endif
