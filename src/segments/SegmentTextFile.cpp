#include "segments/SegmentTextFile.h"

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cstring>
#include <fstream>
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
  layout.columns = layout.width == 0 ? 0 : layout.digits ? QenSegmentDs::MaxDigitOf(format, layout.width) + 1 : layout.width;
  return 0;
}

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

}  // namespace

int SegmentTextFile::ForEachBlock(QenSegmentDs& ds, bool write, const Visit& visit, ConditionList& list) {
  SegmentBuffer* buffer = nullptr;
  if (int status = ds.CreateBuffer(buffer, list)) return status;
  long length = 0, width = 0, bits = 0;
  int status = ds.Init(buffer, list);
  if (status == 0) status = ds.GetLength(length, list);
  if (status == 0) status = ds.GetWidth(width, list);
  if (status == 0) status = ds.GetStateWidth(bits, list);
  const long step = std::max(1L, SegmentBuffer::VectorsPerBlock(width, bits));
  for (long from = 0; status == 0 && from < length && width > 0; from += step) {
    const long to = std::min(length, from + step);
    status = ds.SetBufferStartAndLength(buffer, from, to - from, list);
    if (status == 0) status = visit(buffer, from, to, list);
    if (status == 0 && write) status = ds.Write(buffer, list);
  }
  ConditionList ignored;
  ds.DestroyBuffer(buffer, status == 0 ? list : ignored);
  return status;
}

int SegmentTextFile::Write(QenSegmentDs& ds, DataFormat format, std::ostream& out, ConditionList& list) {
  Layout layout;
  if (int status = LayoutOf(ds, format, layout, list)) return status;
  out << "# segment " << ds.GetName() << ": " << layout.length << " vectors of " << layout.width << " traces, coding \""
      << layout.coding << "\", " << (layout.digits ? InfoOf(format).word : "one state per trace") << ", vector 0 first\n";
  std::string line;
  return ForEachBlock(
      ds, false,
      [&](SegmentBuffer* buffer, long from, long to, ConditionList& l) {
        for (long v = from; v < to; ++v) {
          line.assign(static_cast<std::size_t>(layout.columns), ' ');
          for (long c = 0; c < layout.columns; ++c) {
            const long trace = (layout.columns - 1 - c) * layout.k;
            char& ch = line[static_cast<std::size_t>(c)];
            const int status = layout.digits ? ds.DigitOf(buffer, v, trace, format, ch, l) : ds.GetState(buffer, v, trace, ch, l);
            if (status != 0) return status;
          }
          out << line << '\n';
        }
        return 0;
      },
      list);
}

int SegmentTextFile::Export(QenSegmentDs& ds, DataFormat format, const Dstring& path, ConditionList& list) {
  return ExportFile::Write(path, [&](std::ostream& out) { return Write(ds, format, out, list); }, list);
}

int SegmentTextFile::Read(QenSegmentDs& ds, DataFormat format, std::istream& in, const Dstring& source, ConditionList& list) {
  Layout layout;
  if (int status = LayoutOf(ds, format, layout, list)) return status;
  if (layout.width == 0) return Refuse(list, "GUI_IMPORT_NO_TRACES", {ds.GetName()});
  // The whole file is checked before the segment is touched.
  std::vector<std::string> lines;
  std::string raw;
  for (long number = 1; std::getline(in, raw); ++number) {
    std::string line;
    for (char c : raw) {
      if (c != ' ' && c != '\t' && c != '_' && c != '\r') line += c;
    }
    if (line.empty() || line[0] == '#') continue;
    if (static_cast<long>(line.size()) != layout.columns) {
      return Refuse(list, "GUI_IMPORT_WIDTH",
                    {source, Number(number), Number(static_cast<long>(line.size())), ds.GetName(), Number(layout.width),
                     Number(layout.columns)});
    }
    for (long c = 0; c < layout.columns; ++c) {
      if (ValueAt(layout, format, c, line[static_cast<std::size_t>(c)]) < 0) {
        return Refuse(list, "GUI_IMPORT_CHARACTER",
                      {source, Number(number), Dstring(1, line[static_cast<std::size_t>(c)]), Number(c + 1),
                       layout.digits ? Dstring(InfoOf(format).word) : "\"" + layout.coding + "\""});
      }
    }
    lines.push_back(std::move(line));
  }
  if (in.bad()) return Refuse(list, "GUI_IMPORT_READ", {source, Dstring(std::strerror(errno))});
  if (lines.empty()) return Refuse(list, "GUI_IMPORT_EMPTY", {source});
  const long count = static_cast<long>(lines.size());
  if (count != layout.length) {
    if (int status = ds.SetLength(count, list)) return status;
  }
  return ForEachBlock(
      ds, true,
      [&](SegmentBuffer* buffer, long from, long to, ConditionList& l) {
        for (long v = from; v < to; ++v) {
          const std::string& line = lines[static_cast<std::size_t>(v)];
          for (long c = 0; c < layout.columns; ++c) {
            const long trace = (layout.columns - 1 - c) * layout.k;
            const char ch = line[static_cast<std::size_t>(c)];
            const int status = layout.digits ? ds.SetDigit(buffer, v, trace, format, ch, l) : ds.SetState(buffer, v, trace, ch, l);
            if (status != 0) return status;
          }
        }
        return 0;
      },
      list);
}

int SegmentTextFile::Import(QenSegmentDs& ds, DataFormat format, const Dstring& path, ConditionList& list) {
  errno = 0;
  std::ifstream file(path, std::ios::binary);
  if (!file) return Refuse(list, "GUI_IMPORT_READ", {path, Dstring(std::strerror(errno != 0 ? errno : ENOENT))});
  return Read(ds, format, file, path, list);
}
