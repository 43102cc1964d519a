#pragma once

#include <QString>
#include <QStringList>
#include <cstring>
#include <utility>

#include "support/Dstring.h"

// A place of the rack (":CGR1:MOD3:CONN1", ":CGR1:MOD3:CONN1:BER") as the windows name it:
// "Group 1 › Module 3 › Port 1", the words of the parameter editor's tree. Other words after
// the place ("BER") are left out.
inline QString PlaceName(const Dstring& path) {
  static const std::pair<const char*, const char*> kWords[] = {{"CGR", "Group "}, {"MOD", "Module "}, {"CONN", "Port "}};
  QStringList parts;
  for (const QString& part : QString::fromStdString(path).split(QLatin1Char(':'), Qt::SkipEmptyParts)) {
    for (const auto& [word, text] : kWords) {
      if (part.startsWith(QLatin1String(word))) parts << QLatin1String(text) + part.mid(static_cast<int>(std::strlen(word)));
    }
  }
  return parts.join(QStringLiteral(" \u203A "));
}
