/**
 * @file light_palette.h
 * The colours of the program.
 */
#ifndef LIGHT_PALETTE_H
#define LIGHT_PALETTE_H

#include <QPalette>

/// Returns the style's palette if its ground is light, else a light one: the form has texts in fixed dark
/// colours, which nobody can read on the ground of a dark theme.
QPalette light_palette(const QPalette &of_style);

#endif
