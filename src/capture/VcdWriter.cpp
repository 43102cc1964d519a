#include "capture/VcdWriter.h"

#include <algorithm>
#include <cmath>

#include "support/ExportFile.h"

namespace {

constexpr int kFirstCode = 33;
constexpr int kCodes = 94;

void AddChange(Dstring& changes, bool high, const Dstring& id) {
  changes += high ? '1' : '0';
  changes += id;
  changes += '\n';
}

}  // namespace

Dstring VcdWriter::ScopeName(const Dstring& scope, const char* fallback) {
  Dstring name;
  for (char c : scope) {
    if (c == ':' || c == '/') {
      if (!name.empty()) name += '_';
    } else if (c > ' ' && c < 127) {
      name += c;
    }
  }
  return name.empty() ? Dstring(fallback) : name;
}

Dstring VcdWriter::Identifier(std::size_t index) {
  Dstring id;
  do {
    id += static_cast<char>(kFirstCode + index % kCodes);
    index /= kCodes;
  } while (index > 0);
  return id;
}

void VcdWriter::Write(const CaptureData& data, const Dstring& scope, const Range& range, std::ostream& out) {
  const double ps = data.GetPeriod() * 1e12;
  const bool wholePs = std::fabs(ps - std::round(ps)) < 1e-6 * ps;
  // Times are rounded vector by vector, so that a long capture does not drift.
  const long double tick = wholePs ? std::round(ps) : static_cast<long double>(ps) * 1000.0L;
  auto timeOf = [&](long vector) { return static_cast<unsigned long long>(std::llround(vector * tick)); };
  const long width = data.GetWidth();
  const long busLow = std::max(0L, range.busLow);
  const long busHigh = std::min(width - 1, range.busHigh);
  const Dstring errorId = Identifier(static_cast<std::size_t>(width));
  // The bus's bit of trace t, right after the error wire.
  auto busId = [&](long t) { return Identifier(static_cast<std::size_t>(width + 1 + t - busLow)); };
  auto inBus = [&](long t) { return t >= busLow && t <= busHigh; };

  out << "$version qengui capture $end\n";
  out << "$comment vectors " << range.from << " to " << range.to - 1 << " of " << data.GetLength()
      << "; vector 0 is at time 0 $end\n";
  out << "$timescale 1 " << (wholePs ? "ps" : "fs") << " $end\n";
  out << "$scope module " << ScopeName(scope, "capture") << " $end\n";
  for (long t = 0; t < width; ++t) out << "$var wire 1 " << Identifier(static_cast<std::size_t>(t)) << " d" << t << " $end\n";
  out << "$var wire 1 " << errorId << " error $end\n";
  for (long t = busHigh; t >= busLow; --t) out << "$var wire 1 " << busId(t) << " bus [" << t << "] $end\n";
  out << "$upscope $end\n$enddefinitions $end\n";
  for (long v = range.from; v < range.to; ++v) {
    Dstring changes;
    for (long t = 0; t < width; ++t) {
      const bool high = data.Bit(t, v);
      if (v != range.from && high == data.Bit(t, v - 1)) continue;
      AddChange(changes, high, Identifier(static_cast<std::size_t>(t)));
      if (inBus(t)) AddChange(changes, high, busId(t));
    }
    const bool error = data.HasError(v, v + 1);
    if (v == range.from || error != data.HasError(v - 1, v)) AddChange(changes, error, errorId);
    if (changes.empty()) continue;
    out << '#' << timeOf(v) << '\n';
    if (v == range.from) out << "$dumpvars\n" << changes << "$end\n";
    else out << changes;
  }
  out << '#' << timeOf(range.to) << '\n';
}

int VcdWriter::WriteFile(const CaptureData& data, const Dstring& scope, const Range& range, const Dstring& path,
                         ConditionList& list) {
  return ExportFile::Write(path, [&](std::ostream& out) { Write(data, scope, range, out); return 0; }, list);
}
