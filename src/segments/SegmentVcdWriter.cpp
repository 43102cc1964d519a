#include "segments/SegmentVcdWriter.h"

#include <string>

#include "segments/QenSegmentDs.h"
#include "segments/SegmentTextFile.h"
#include "support/ExportFile.h"
#include "support/VcdText.h"

namespace {

char VcdValue(char state) {
  const int bit = QenSegmentDs::BitOf(state);
  if (bit >= 0) return bit != 0 ? '1' : '0';
  return state == 'Z' || state == 'z' ? 'z' : 'x';
}

}  // namespace

int SegmentVcdWriter::Write(QenSegmentDs& ds, std::ostream& out, ConditionList& list) {
  long width = 0;
  if (int status = ds.GetWidth(width, list, true)) return status;
  auto id = [](long t) { return VcdText::Identifier(static_cast<std::size_t>(t)); };
  const Dstring errorId = id(width);
  out << "$version qengui segment $end\n$timescale 1 ns $end\n";
  out << "$scope module " << VcdText::ScopeName(ds.GetName(), "segment") << " $end\n";
  for (long t = 0; t < width; ++t) VcdText::Wire(out, id(t), Dstring::Format("t%ld", t));
  VcdText::Wire(out, errorId, "error");
  out << "$upscope $end\n$enddefinitions $end\n";
  // The values last written, '\0' before the first vector.
  std::string last(static_cast<std::size_t>(width) + 1, '\0');
  long end = 0;
  const int status = SegmentTextFile::ForEachBlock(
      ds, false, 0, -1,
      [&](SegmentBuffer* buffer, long from, long to, ConditionList& l) {
        Dstring changes;
        for (long v = from; v < to; ++v) {
          changes.clear();
          bool error = false;
          for (long t = 0; t <= width; ++t) {
            char value = '0';
            if (t < width) {
              char state = 0;
              if (int s = ds.GetState(buffer, v, t, state, l)) return s;
              error = error || QenSegmentDs::IsErrored(state);
              value = VcdValue(state);
            } else {
              value = error ? '1' : '0';
            }
            char& before = last[static_cast<std::size_t>(t)];
            if (value == before) continue;
            before = value;
            VcdText::AddChange(changes, value, t < width ? id(t) : errorId);
          }
          if (changes.empty()) continue;
          VcdText::Step(out, static_cast<unsigned long long>(v), changes, v == 0);
        }
        end = to;
        return 0;
      },
      list);
  if (status == 0) out << '#' << end << '\n';
  return status;
}

int SegmentVcdWriter::WriteFile(QenSegmentDs& ds, const Dstring& path, ConditionList& list) {
  return ExportFile::Write(path, [&](std::ostream& out) { return Write(ds, out, list); }, list);
}
