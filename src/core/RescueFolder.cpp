#include "core/RescueFolder.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>

#include "instrument/QenStatus.h"
#include "segments/QenSegmentPool.h"
#include "segments/SegmentTextFile.h"
#include "sequences/CSequence.h"
#include "support/ConditionListLoader.h"
#include "support/ExportFile.h"

namespace {

namespace fs = std::filesystem;

int Refuse(ConditionList& list, const char* key, std::initializer_list<Dstring> args) {
  ConditionListLoader::ConditionToken(list, key, args, 1);
  return 1;
}

Dstring Join(const Dstring& folder, const Dstring& file) {
  return (fs::path(folder.c_str()) / file.c_str()).string();
}

Dstring Number(long n) {
  return Dstring::Format("%ld", n);
}

std::vector<Dstring> Fields(const std::string& line) {
  std::vector<Dstring> fields;
  std::size_t from = 0;
  for (std::size_t tab; (tab = line.find('\t', from)) != std::string::npos; from = tab + 1) {
    fields.emplace_back(line.substr(from, tab - from));
  }
  fields.emplace_back(line.substr(from));
  return fields;
}

bool ToLong(const Dstring& text, long& value) {
  char* end = nullptr;
  value = std::strtol(text.c_str(), &end, 10);
  return !text.empty() && *end == '\0' && value >= 0;
}

// A segment line: file, name, coding, width, length, first vector, count, whole or part.
bool ReadSegment(const std::vector<Dstring>& f, RescueFolder::Segment& segment) {
  QenSegmentDs::HeldText& held = segment.held;
  if (f.size() != 9 || f[1].empty() || f[2].empty() || f[3].empty() || (f[8] != "whole" && f[8] != "part"))
    return false;
  segment.file = f[1];
  segment.name = f[2];
  held.coding = f[3];
  held.whole = f[8] == "whole";
  return ToLong(f[4], held.width) && ToLong(f[5], held.length) && ToLong(f[6], held.first) &&
         ToLong(f[7], held.count) && held.first + held.count <= held.length && held.width > 0 &&
         fs::path(segment.file.c_str()).filename() == segment.file.c_str();
}

}  // namespace

int RescueFolder::Write(const Dstring& path, const Dstring& written, const std::vector<Segment>& segments,
                        const Dstring& sequence, ConditionList& list) {
  std::error_code error;
  fs::create_directories(path.c_str(), error);
  if (error) return Refuse(list, "GUI_EXPORT_FAILED", {path, Dstring(error.message())});
  std::ostringstream names;
  names << "# Work that was not saved when the server died at " << written << ".\n"
        << "# Each segment file is in the segment editor's text form: Segment > Import Text reads it.\n"
        << "written\t" << written << '\n';
  for (const Segment& s : segments) {
    if (int status = ExportFile::WriteText(Join(path, s.file), s.held.text, list)) return status;
    const QenSegmentDs::HeldText& h = s.held;
    names << "segment\t" << s.file << '\t' << s.name << '\t' << h.coding << '\t' << h.width << '\t'
          << h.length << '\t' << h.first << '\t' << h.count << '\t' << (h.whole ? "whole" : "part") << '\n';
  }
  if (!sequence.empty()) {
    if (int status = ExportFile::WriteText(Join(path, kSequenceName), sequence + "\n", list)) return status;
    names << "sequence\t" << kSequenceName << '\n';
  }
  names << "end\n";
  const Dstring draft = Join(path, Dstring(kListName) + ".part");
  if (int status = ExportFile::WriteText(draft, names.str(), list)) return status;
  fs::rename(draft.c_str(), Join(path, kListName).c_str(), error);
  if (error) return Refuse(list, "GUI_EXPORT_FAILED", {Join(path, kListName), Dstring(error.message())});
  return 0;
}

int RescueFolder::Read(const Dstring& path, RescueFolder& folder, ConditionList& list) {
  const Dstring file = Join(path, kListName);
  std::ifstream in(file.c_str());
  if (!in) return Refuse(list, "GUI_IMPORT_READ", {file, "it cannot be opened"});
  RescueFolder read;
  read.mPath = path;
  bool ended = false;
  std::string line;
  for (long number = 1; std::getline(in, line); ++number) {
    if (line.empty() || line[0] == '#') continue;
    const std::vector<Dstring> f = Fields(line);
    bool good = !ended;
    if (good && f[0] == "written" && f.size() == 2) {
      read.mWritten = f[1];
    } else if (good && f[0] == "segment") {
      Segment segment;
      good = ReadSegment(f, segment);
      read.mSegments.push_back(std::move(segment));
    } else if (good && f[0] == "sequence" && f.size() == 2 && f[1] == kSequenceName) {
      read.mSequenceFile = f[1];
    } else if (good && f[0] == "end" && f.size() == 1) {
      ended = true;
    } else {
      good = false;
    }
    if (!good) return Refuse(list, "GUI_RESCUE_BAD_LIST", {file, Number(number)});
  }
  if (!ended) return Refuse(list, "GUI_RESCUE_BAD_LIST", {file, "its end"});
  folder = std::move(read);
  return 0;
}

std::vector<Dstring> RescueFolder::Pending(const Dstring& root) {
  std::vector<Dstring> pending;
  std::error_code error;
  for (fs::directory_iterator it(root.c_str(), error), end; !error && it != end; it.increment(error)) {
    std::error_code ignored;
    if (it->is_directory(ignored) && fs::is_regular_file(it->path() / kListName, ignored) &&
        !fs::exists(it->path() / kAnswerName, ignored)) {
      pending.emplace_back(it->path().string());
    }
  }
  std::sort(pending.begin(), pending.end());
  return pending;
}

Dstring RescueFolder::Summary(const std::vector<Segment>& segments, bool sequence) {
  std::vector<Dstring> names;
  for (const Segment& s : segments) {
    if (std::find(names.begin(), names.end(), s.name) == names.end()) names.push_back(s.name);
  }
  Dstring text;
  for (std::size_t i = 0; i < names.size(); ++i) {
    if (i > 0) text += i + 1 == names.size() ? " and " : ", ";
    text += "\"" + names[i] + "\"";
  }
  if (!text.empty()) text = (names.size() == 1 ? "the segment " : "the segments ") + text;
  if (sequence) text += text.empty() ? "the sequence" : " and the sequence";
  return text;
}

int RescueFolder::PutBackSegment(const Segment& segment, ConditionList& list) const {
  const QenSegmentDs::HeldText& held = segment.held;
  const Dstring file = Join(mPath, segment.file);
  QenSegmentDs* ds = QenSegmentPool::AllocDs(segment.name);
  int status = ds->Open(list);
  if (status != 0) {
    QenSegmentPool::FreeDs(ds);
    return status;
  }
  Dstring coding;
  long width = 0, length = 0;
  status = ds->GetCoding(coding, list, true);
  if (status == 0 && coding != held.coding) status = ds->SetCoding(held.coding, list);
  if (status == 0) status = ds->GetWidth(width, list, true);
  if (status == 0 && width != held.width) status = ds->SetWidth(held.width, list);
  if (status == 0 && held.whole) status = SegmentTextFile::Import(*ds, DataFormat::kHex, file, list);
  if (status == 0 && !held.whole) {
    status = ds->GetLength(length, list, true);
    if (status == 0 && length < held.first + held.count) {
      status =
          Refuse(list, "GUI_RESCUE_PART_OUTSIDE",
                 {segment.name, Number(held.first), Number(held.first + held.count - 1), Number(length)});
    }
    std::ifstream in(file.c_str(), std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    if (status == 0 && !in) status = Refuse(list, "GUI_IMPORT_READ", {file, "it cannot be opened"});
    if (status == 0)
      status = SegmentTextFile::Paste(*ds, DataFormat::kHex, text.str(), held.first, held.width - 1, list);
  }
  if (status == 0) status = ds->Save(list);
  ConditionList closing;
  ds->Close(status == 0 ? list : closing);
  QenSegmentPool::FreeDs(ds);
  return status;
}

int RescueFolder::PutBack(CSequence& sequence, ConditionList& list) const {
  Dstring done;
  for (const Segment& segment : mSegments) {
    if (int status = PutBackSegment(segment, list)) {
      if (status != QenStatus::kLocked)
        Refuse(list, "GUI_RESCUE_STOPPED", {segment.name, done.empty() ? Dstring("nothing") : done});
      return status;
    }
    done += (done.empty() ? "\"" : ", \"") + segment.name + "\"";
  }
  if (!HasSequence()) return 0;
  const Dstring file = Join(mPath, mSequenceFile);
  std::ifstream in(file.c_str(), std::ios::binary);
  std::string expression;
  if (!std::getline(in, expression) || expression.empty())
    return Refuse(list, "GUI_IMPORT_READ", {file, "it holds no sequence"});
  if (int status = sequence.ReadSequence(list, 0)) return status;
  const Dstring held = sequence.GetLastExpression();
  int status = sequence.fromExpression(expression, list);
  if (status == 0) status = sequence.WriteSequence(list);
  // Refused before anything was written: the model shows the instrument's sequence again.
  if (status != 0 && sequence.GetLastExpression() == held && !held.empty()) {
    ConditionList ignored;
    sequence.fromExpression(held, ignored);
  }
  return status;
}

int RescueFolder::Answer(const Dstring& answer, ConditionList& list) const {
  return ExportFile::WriteText(Join(mPath, kAnswerName), answer + "\n", list);
}
