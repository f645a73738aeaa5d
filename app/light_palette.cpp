// The colours of the program.
#include "light_palette.h"

QPalette light_palette(const QPalette &of_style) {
  constexpr int kMiddle = 128;
  if (of_style.color(QPalette::Window).lightness() >= kMiddle) return of_style;
  const QColor ground(239, 239, 239);
  QPalette light(ground, ground);  // all other colours follow from these two
  light.setColor(QPalette::Highlight, QColor(28, 100, 150));
  light.setColor(QPalette::HighlightedText, Qt::white);
  light.setColor(QPalette::Disabled, QPalette::Highlight, QColor(145, 145, 145));
  light.setColor(QPalette::ToolTipBase, QColor(255, 255, 220));
  light.setColor(QPalette::ToolTipText, Qt::black);
  return light;
}
