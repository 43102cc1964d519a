#include "capture/VcdWriter.h"

#include <algorithm>
#include <cmath>

#include "support/ExportFile.h"
#include "support/VcdText.h"

void VcdWriter::Write(const CaptureData& data, const Dstring& scope, const Range& range, std::ostream& out) {
  const double ps = data.GetPeriod() * 1e12;
  const bool wholePs = std::fabs(ps - std::round(ps)) < 1e-6 * ps;
  // Times are rounded vector by vector, so that a long capture does not drift.
  const long double tick = wholePs ? std::round(ps) : static_cast<long double>(ps) * 1000.0L;
  auto timeOf = [&](long vector) { return static_cast<unsigned long long>(std::llround(vector * tick)); };
  const long width = data.GetWidth();
  const long busLow = std::max(0L, range.busLow);
  const long busHigh = std::min(width - 1, range.busHigh);
  auto id = [](long t) { return VcdText::Identifier(static_cast<std::size_t>(t)); };
  const Dstring errorId = id(width);
  // The bus's bit of trace t, right after the error wire.
  auto busId = [&](long t) { return id(width + 1 + t - busLow); };
  auto inBus = [&](long t) { return t >= busLow && t <= busHigh; };

  out << "$version qengui capture $end\n";
  out << "$comment vectors " << range.from << " to " << range.to - 1 << " of " << data.GetLength()
      << "; vector 0 is at time 0 $end\n";
  out << "$timescale 1 " << (wholePs ? "ps" : "fs") << " $end\n";
  out << "$scope module " << VcdText::ScopeName(scope, "capture") << " $end\n";
  for (long t = 0; t < width; ++t) VcdText::Wire(out, id(t), Dstring::Format("d%ld", t));
  VcdText::Wire(out, errorId, "error");
  for (long t = busHigh; t >= busLow; --t) VcdText::Wire(out, busId(t), Dstring::Format("bus [%ld]", t));
  out << "$upscope $end\n$enddefinitions $end\n";
  for (long v = range.from; v < range.to; ++v) {
    Dstring changes;
    for (long t = 0; t < width; ++t) {
      const bool high = data.Bit(t, v);
      if (v != range.from && high == data.Bit(t, v - 1)) continue;
      VcdText::AddChange(changes, high ? '1' : '0', id(t));
      if (inBus(t)) VcdText::AddChange(changes, high ? '1' : '0', busId(t));
    }
    const bool error = data.HasError(v, v + 1);
    if (v == range.from || error != data.HasError(v - 1, v))
      VcdText::AddChange(changes, error ? '1' : '0', errorId);
    if (changes.empty()) continue;
    VcdText::Step(out, timeOf(v), changes, v == range.from);
  }
  out << '#' << timeOf(range.to) << '\n';
}

int VcdWriter::WriteFile(const CaptureData& data, const Dstring& scope, const Range& range, const Dstring& path,
                         ConditionList& list) {
  return ExportFile::Write(path, [&](std::ostream& out) { Write(data, scope, range, out); return 0; }, list);
}
