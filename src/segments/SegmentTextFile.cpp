#include "segments/SegmentTextFile.h"

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "segments/QenSegmentDs.h"
#include "segments/SegmentBuffer.h"
#include "support/ConditionListLoader.h"
#include "support/ExportFile.h"

namespace {

// How the lines of one segment are spelt.
struct Layout {
  Dstring coding;
  long length = 0;
  long width = 0;
  bool digits = false;  // "01": digits of the format; else a coding character per trace
  long columns = 0;     // characters per line
  long k = 1;           // traces per digit
};

int LayoutOf(QenSegmentDs& ds, DataFormat format, Layout& layout, ConditionList& list) {
  if (int status = ds.GetCoding(layout.coding, list, true)) return status;
  if (int status = ds.GetLength(layout.length, list, true)) return status;
  if (int status = ds.GetWidth(layout.width, list, true)) return status;
  // Digits set traces to "0" and "1", so only that coding is written in digits.
  layout.digits = layout.coding == "01";
  layout.k = layout.digits ? InfoOf(format).tracesPerDigit : 1;
  if (layout.k == 0) {
    list.Add(1, "The data format is not one of binary, octal and hexadecimal.");
    return 1;
  }
  layout.columns = layout.width == 0 ? 0 : layout.digits ? QenSegmentDs::MaxDigitOf(format, layout.width) + 1 : layout.width;
  return 0;
}

// The column of the text form that holds `trace`.
long ColumnOf(const Layout& layout, long trace) { return layout.columns - 1 - trace / layout.k; }

int Refuse(ConditionList& list, const char* key, std::initializer_list<Dstring> args) {
  ConditionListLoader::ConditionToken(list, key, args, 1);
  return 1;
}

Dstring Number(long n) { return Dstring::Format("%ld", n); }

// The value of one character at column `column` of a line, or -1 when the line may not hold it.
int ValueAt(const Layout& layout, DataFormat format, long column, char c) {
  if (!layout.digits) return layout.coding.find(c) == Dstring::npos ? -1 : 0;
  const char* digits = InfoOf(format).digits;
  const char* at = std::strchr(digits, std::tolower(static_cast<unsigned char>(c)));
  if (c == '\0' || at == nullptr) return -1;
  const int value = static_cast<int>(at - digits);
  // The leftmost digit may cover fewer traces than the format groups.
  const long traces = column == 0 ? layout.width - (layout.columns - 1) * layout.k : layout.k;
  return value < (1 << traces) ? value : -1;
}

// Checks every line of `in` against the columns [first, first + width) of the layout; the
// lines read are the text without blanks, underscores and comments. width < 0: the whole line.
int Parse(const Layout& layout, DataFormat format, std::istream& in, const Dstring& source, const Dstring& segment,
          long first, long width, std::vector<std::string>& lines, ConditionList& list) {
  std::string raw;
  for (long number = 1; std::getline(in, raw); ++number) {
    std::string line;
    for (char c : raw) {
      if (c != ' ' && c != '\t' && c != '_' && c != '\r') line += c;
    }
    if (line.empty() || line[0] == '#') continue;
    const long size = static_cast<long>(line.size());
    if ((width < 0 && size != layout.columns) || (width >= 0 && size > width)) {
      return Refuse(list, width < 0 ? "GUI_IMPORT_WIDTH" : "GUI_PASTE_TOO_WIDE",
                    {source, Number(number), Number(size), segment, Number(layout.width), Number(width < 0 ? layout.columns : width)});
    }
    for (long c = 0; c < size; ++c) {
      const char ch = line[static_cast<std::size_t>(c)];
      if (ValueAt(layout, format, first + c, ch) < 0) {
        return Refuse(list, "GUI_IMPORT_CHARACTER",
                      {source, Number(number), Dstring(1, ch), Number(c + 1),
                       layout.digits ? Dstring(InfoOf(format).word) : "\"" + layout.coding + "\""});
      }
    }
    lines.push_back(std::move(line));
  }
  if (in.bad()) return Refuse(list, "GUI_IMPORT_READ", {source, Dstring(std::strerror(errno))});
  if (lines.empty()) return Refuse(list, "GUI_IMPORT_EMPTY", {source});
  return 0;
}

// Writes `lines` with their first character at (vector, column), block by block.
int Put(QenSegmentDs& ds, DataFormat format, const Layout& layout, const std::vector<std::string>& lines, long vector, long column,
        ConditionList& list) {
  const long last = vector + static_cast<long>(lines.size()) - 1;
  return SegmentTextFile::ForEachBlock(
      ds, true, vector, last,
      [&](SegmentBuffer* buffer, long from, long to, ConditionList& l) {
        for (long v = from; v < to; ++v) {
          const std::string& line = lines[static_cast<std::size_t>(v - vector)];
          for (long c = 0; c < static_cast<long>(line.size()); ++c) {
            const long trace = (layout.columns - 1 - column - c) * layout.k;
            const char ch = line[static_cast<std::size_t>(c)];
            const int status = layout.digits ? ds.SetDigit(buffer, v, trace, format, ch, l) : ds.SetState(buffer, v, trace, ch, l);
            if (status != 0) return status;
          }
        }
        return 0;
      },
      list);
}

// The lines of an area, each ended by a newline.
int Lines(QenSegmentDs& ds, DataFormat format, const Layout& layout, const StateRange& range,
          std::ostream& out, ConditionList& list) {
  const long firstColumn = ColumnOf(layout, range.GetLastTrace());
  const long lastColumn = ColumnOf(layout, range.GetFirstTrace());
  return SegmentTextFile::ForEachBlock(
      ds, false, range.GetFirstVector(), range.GetLastVector(),
      [&](SegmentBuffer* buffer, long from, long to, ConditionList& l) {
        int status = 0;
        for (long v = from; v < to && status == 0; ++v) {
          const Dstring line = SegmentTextFile::Line(
              [&](long trace) {
                char state = '?';
                if (status == 0) status = ds.GetState(buffer, v, trace, state, l);
                return state;
              },
              layout.width, layout.coding, format);
          if (status == 0)
            out << std::string_view(line).substr(static_cast<std::size_t>(firstColumn),
                                                 static_cast<std::size_t>(lastColumn - firstColumn + 1))
                << '\n';
        }
        return status;
      },
      list);
}

SegmentTextFile::Progress& CurrentProgress() {
  static SegmentTextFile::Progress progress;
  return progress;
}

}  // namespace

SegmentTextFile::ProgressScope::ProgressScope(Progress progress) : mOuter(std::move(CurrentProgress())) {
  CurrentProgress() = std::move(progress);
}

SegmentTextFile::ProgressScope::~ProgressScope() { CurrentProgress() = std::move(mOuter); }

int SegmentTextFile::ForEachBlock(QenSegmentDs& ds, bool write, long first, long last, const Visit& visit, ConditionList& list) {
  SegmentBuffer* buffer = nullptr;
  if (int status = ds.CreateBuffer(buffer, list)) return status;
  long length = 0, width = 0, bits = 0;
  int status = ds.Init(buffer, list);
  if (status == 0) status = ds.GetLength(length, list);
  if (status == 0) status = ds.GetWidth(width, list);
  if (status == 0) status = ds.GetStateWidth(bits, list);
  const long step = std::max(1L, SegmentBuffer::VectorsPerBlock(width, bits));
  const long end = last < 0 ? length : std::min(length, last + 1);
  const long start = std::max(0L, first);
  const Progress& progress = CurrentProgress();
  for (long from = start; status == 0 && from < end && width > 0; from += step) {
    const long to = std::min(end, from + step);
    status = ds.SetBufferStartAndLength(buffer, from, to - from, list);
    if (status == 0) status = visit(buffer, from, to, list);
    if (status == 0 && write) status = ds.Write(buffer, list);
    if (status == 0 && progress && !progress(to - start, end - start)) {
      status = Refuse(list, "GUI_TRANSFER_STOPPED", {Number(to - start), Number(end - start)});
    }
  }
  ConditionList ignored;
  ds.DestroyBuffer(buffer, status == 0 ? list : ignored);
  return status;
}

int SegmentTextFile::Write(QenSegmentDs& ds, DataFormat format, std::ostream& out, ConditionList& list) {
  Layout layout;
  if (int status = LayoutOf(ds, format, layout, list)) return status;
  out << Header(ds.GetName(), layout.length, layout.width, layout.coding, format) << '\n';
  return Lines(ds, format, layout, StateRange(0, 0, layout.width - 1, layout.length - 1), out, list);
}

Dstring SegmentTextFile::Header(const Dstring& name, long length, long width, const Dstring& coding,
                                DataFormat format) {
  return Dstring::Format("# segment %s: %ld vectors of %ld traces, coding \"%s\", %s, vector 0 first",
                         name.c_str(), length, width, coding.c_str(),
                         coding == "01" ? InfoOf(format).word : "one state per trace");
}

Dstring SegmentTextFile::PartHeader(const Dstring& name, long first, long last, long length, long width,
                                    const Dstring& coding, DataFormat format) {
  return Dstring::Format("# segment %s: vectors %ld to %ld of %ld vectors of %ld traces, coding \"%s\", %s",
                         name.c_str(), first, last, length, width, coding.c_str(),
                         coding == "01" ? InfoOf(format).word : "one state per trace");
}

Dstring SegmentTextFile::Line(const StateAt& state, long width, const Dstring& coding, DataFormat format) {
  Dstring line;
  if (coding != "01") {
    for (long t = width - 1; t >= 0; --t) line += state(t);
    return line;
  }
  const long k = InfoOf(format).tracesPerDigit;
  char states[4];
  for (long d = QenSegmentDs::MaxDigitOf(format, width); d >= 0; --d) {
    const long low = d * k;
    const long count = std::min(k, width - low);
    for (long i = 0; i < count; ++i) states[i] = state(low + i);
    line += QenSegmentDs::DigitOfStates(states, count, format);
  }
  return line;
}

int SegmentTextFile::RangeText(QenSegmentDs& ds, DataFormat format, const StateRange& range, Dstring& text, ConditionList& list) {
  Layout layout;
  if (int status = LayoutOf(ds, format, layout, list)) return status;
  std::ostringstream out;
  if (int status = Lines(ds, format, layout, range, out, list)) return status;
  text = out.str();
  return 0;
}

int SegmentTextFile::Export(QenSegmentDs& ds, DataFormat format, const Dstring& path, ConditionList& list) {
  return ExportFile::Write(path, [&](std::ostream& out) { return Write(ds, format, out, list); }, list);
}

int SegmentTextFile::Read(QenSegmentDs& ds, DataFormat format, std::istream& in, const Dstring& source, ConditionList& list) {
  Layout layout;
  if (int status = LayoutOf(ds, format, layout, list)) return status;
  if (layout.width == 0) return Refuse(list, "GUI_IMPORT_NO_TRACES", {ds.GetName()});
  std::vector<std::string> lines;
  if (int status = Parse(layout, format, in, source, ds.GetName(), 0, -1, lines, list)) return status;
  const long count = static_cast<long>(lines.size());
  if (count != layout.length) {
    if (int status = ds.SetLength(count, list)) return status;
  }
  return Put(ds, format, layout, lines, 0, 0, list);
}

int SegmentTextFile::Import(QenSegmentDs& ds, DataFormat format, const Dstring& path, ConditionList& list) {
  errno = 0;
  std::ifstream file(path, std::ios::binary);
  if (!file) return Refuse(list, "GUI_IMPORT_READ", {path, Dstring(std::strerror(errno != 0 ? errno : ENOENT))});
  return Read(ds, format, file, path, list);
}

int SegmentTextFile::Paste(QenSegmentDs& ds, DataFormat format, const Dstring& text, long vector, long trace, ConditionList& list) {
  Layout layout;
  if (int status = LayoutOf(ds, format, layout, list)) return status;
  const long column = ColumnOf(layout, trace);
  std::istringstream in(text);
  std::vector<std::string> lines;
  const Dstring source = "the clipboard";
  if (int status = Parse(layout, format, in, source, ds.GetName(), column, layout.columns - column, lines, list)) return status;
  if (vector + static_cast<long>(lines.size()) > layout.length) {
    return Refuse(list, "GUI_PASTE_TOO_LONG",
                  {Number(static_cast<long>(lines.size())), Number(vector), Number(layout.length - vector)});
  }
  return Put(ds, format, layout, lines, vector, column, list);
}
