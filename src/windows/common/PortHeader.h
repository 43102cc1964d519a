#pragma once

#include <QString>
#include <utility>

#include "sequences/CPortInfo.h"
#include "windows/common/PlaceName.h"

// The heading of sequence port `port` (a data port, from 1): its place on two lines and whether
// it generates or analyses ("Group 1 › Module 2\nPort 1\ngenerator"); the tool tip adds the
// module's model. Empty for a port the configuration does not know.
inline QString PortHeader(unsigned long port, QString* toolTip = nullptr) {
  unsigned long p = 0;
  for (const CPortInfo::Port& info : CPortInfo::GetPorts()) {
    if (info.portClass != "PDAT" || ++p != port) continue;
    QString place = PlaceName(info.path);
    if (toolTip != nullptr)
      *toolTip = QStringLiteral("%1, %2").arg(place, QString::fromStdString(info.model));
    const int last = place.lastIndexOf(QStringLiteral(" \u203A "));
    if (last >= 0) place.replace(last, 3, QStringLiteral("\n"));
    const QString kind = info.type == "OUTPUT_PORT"  ? QStringLiteral("generator")
                         : info.type == "INPUT_PORT" ? QStringLiteral("analyser")
                                                     : QString::fromStdString(info.type);
    return place + QLatin1Char('\n') + kind;
  }
  return {};
}

// The same heading in short words, for narrow columns: "G1\nM2\nP1\ngen".
inline QString ShortPortHeader(QString header) {
  static const std::pair<const char*, const char*> kShort[] = {
      {"Group ", "G"}, {"Module ", "M"}, {"Port ", "P"}, {"generator", "gen"}, {"analyser", "ana"}};
  for (const auto& [word, brief] : kShort) header.replace(QLatin1String(word), QLatin1String(brief));
  return header;
}
