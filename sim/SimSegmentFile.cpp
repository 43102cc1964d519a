#include "SimSegmentFile.h"

#include <filesystem>
#include <fstream>
#include <map>

#include "support/DataParcel.h"
#include "support/ParserExpression.h"

namespace {

constexpr const char* kMagic = "QENSIM-SEGMENT 1";

struct Head {
  Dstring type;
  Dstring coding;
  long width = -1;
  long length = -1;
  long bytes = -1;
  std::map<Dstring, Dstring> params;
};

// One head line into `head`; false when it is not one of the known lines.
bool ReadLine(const Dstring& line, Head& head) {
  const std::size_t blank = line.find(' ');
  const Dstring key = line.substr(0, blank);
  const Dstring rest = blank == Dstring::npos ? Dstring() : Dstring(line.substr(blank + 1));
  DataParcel items;
  ConditionList ignored;
  if (key == "param") {
    const std::size_t split = rest.find("\" ");
    if (split == Dstring::npos || ParserExpression::Parse(rest.substr(0, split + 1), items, ignored) != 0)
      return false;
    if (items.size() != 1 || !items[0].IsText()) return false;
    head.params[Dstring(items[0].GetText())] = rest.substr(split + 2);
    return true;
  }
  if (ParserExpression::Parse(rest, items, ignored) != 0 || items.empty()) return false;
  if (key == "data")
    return items.size() == 2 && items[0].GetLong(head.length) && items[1].GetLong(head.bytes);
  if (items.size() != 1) return false;
  if (key == "width") return items[0].GetLong(head.width);
  Dstring* text = key == "type" ? &head.type : key == "coding" ? &head.coding : nullptr;
  if (text == nullptr || !items[0].IsText()) return false;
  *text = Dstring(items[0].GetText());
  return true;
}

}  // namespace

bool SimSegmentFile::Save(const SimSegment& segment, const std::string& path) {
  std::error_code error;
  std::filesystem::create_directories(std::filesystem::path(path).parent_path(), error);
  const std::string temporary = path + ".part";
  {
    std::ofstream out(temporary, std::ios::binary | std::ios::trunc);
    const SimSegmentRows& rows = segment.GetRows();
    const bool memory = !segment.IsGenerated();
    const long bytes =
        memory ? static_cast<long>(SimSegmentRows::RowBytes(rows.GetLength(), rows.GetStateWidth())) *
                     rows.GetWidth()
               : 0;
    out << kMagic << "\ntype " << segment.GetType() << "\ncoding \"" << segment.GetCoding() << "\"\nwidth "
        << segment.GetWidth() << "\n";
    for (const auto& [name, value] : segment.GetParams()) out << "param \"" << name << "\" " << value << "\n";
    out << "data " << (memory ? rows.GetLength() : 0) << "," << bytes << "\n";
    for (long t = 0; memory && t < rows.GetWidth(); ++t) {
      out.write(reinterpret_cast<const char*>(rows.Row(t).data()),
                static_cast<std::streamsize>(rows.Row(t).size()));
    }
    if (!out.flush()) return false;
  }
  std::filesystem::rename(temporary, path, error);
  return !error;
}

int SimSegmentFile::Load(const std::string& path, SimSegment& segment) {
  std::ifstream in(path, std::ios::binary);
  if (!in) return -256;
  std::string line;
  if (!std::getline(in, line) || line != kMagic) return -200;
  Head head;
  while (head.bytes < 0) {
    if (!std::getline(in, line) || !ReadLine(line, head)) return -200;
  }
  const int stateWidth = SimSegment::StateWidthOf(head.coding);
  const bool memory = head.type == "MEM";
  const long rows = memory ? head.width : 0;
  if (head.width < 0 || head.width > SimSegment::kMaxWidth || head.length < 0 ||
      static_cast<long long>(rows) * head.length * stateWidth > SimSegment::kMaxBits ||
      head.bytes != static_cast<long>(SimSegmentRows::RowBytes(head.length, stateWidth)) * rows) {
    return -200;
  }
  SimSegmentRows data(rows, memory ? head.length : 0, stateWidth);
  for (long t = 0; t < rows; ++t) {
    auto& row = data.Row(t);
    if (!in.read(reinterpret_cast<char*>(row.data()), static_cast<std::streamsize>(row.size()))) return -200;
  }
  return segment.Restore(head.type, head.coding, head.width, std::move(head.params), std::move(data));
}
