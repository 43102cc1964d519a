#pragma once

#include <QString>

// A count with its digits in groups of three, a thin space between, as the windows show
// counts ("1 234 567").
inline QString GroupedCount(unsigned long long value) {
  QString digits = QString::number(value);
  for (auto at = digits.size() - 3; at > 0; at -= 3) digits.insert(at, QChar(0x2009));
  return digits;
}

// The same for a number that may be negative, with a minus sign.
inline QString GroupedNumber(long long value) {
  const unsigned long long size = value < 0 ? 0ull - static_cast<unsigned long long>(value) : static_cast<unsigned long long>(value);
  return value < 0 ? QStringLiteral("\u2212") + GroupedCount(size) : GroupedCount(size);
}
