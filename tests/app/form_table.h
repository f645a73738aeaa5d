#ifndef FORM_TABLE_H
#define FORM_TABLE_H

#include <QFile>
#include <QStringList>
#include <string>
#include <vector>

/// Lines of form.txt that begin with `kind`, without it; an empty kind gets the widgets' lines.
inline std::vector<std::string> lines_of_form(const QString &kind) {
  QFile file(QStringLiteral(FORM_TABLE));
  std::vector<std::string> lines;
  if (!file.open(QIODevice::ReadOnly)) return lines;
  for (const QString &line : QString::fromUtf8(file.readAll()).split('\n', Qt::SkipEmptyParts)) {
    const QString found = QStringList{"tab", "connect", "slot", "state"}.contains(line.section('|', 0, 0))
                              ? line.section('|', 0, 0)
                              : QString();
    if (found == kind && line[0] != '#')
      lines.push_back((kind.isEmpty() ? line : line.section('|', 1)).toStdString());
  }
  return lines;
}

#endif
