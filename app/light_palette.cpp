// The colours of the program.
#include "light_palette.h"

QPalette light_palette(const QPalette &of_style) {
  constexpr int kMiddle = 128;
  const QColor ground(239, 239, 239);
  const bool light = of_style.color(QPalette::Window).lightness() >= kMiddle;
  QPalette palette = light ? of_style : QPalette(ground, ground);  // all colours follow from these two
  // The usual blue is too light for selected white text.
  for (const QPalette::ColorGroup group : {QPalette::Active, QPalette::Inactive}) {
    palette.setColor(group, QPalette::Highlight, QColor(28, 100, 150));
    palette.setColor(group, QPalette::HighlightedText, Qt::white);
  }
  if (!light) palette.setColor(QPalette::Disabled, QPalette::Highlight, QColor(145, 145, 145));
  return palette;
}
