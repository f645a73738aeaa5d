/**
 * @file control_texts.h
 * What a screen reader says about the controls of the dialog, and what Shift+F1 shows.
 */
#ifndef CONTROL_TEXTS_H
#define CONTROL_TEXTS_H

class QWidget;

/// Gives each control of the dialog, in the current language, an accessible name, an accessible description
/// (unit and range, or what it does) and a "What's This" text (both, and when it counts). So does it for the
/// group that has no title.
void set_control_texts(const QWidget &dialog);

#endif
