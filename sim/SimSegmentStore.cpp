#include "SimSegmentStore.h"

#include <algorithm>
#include <chrono>
#include <climits>
#include <ctime>

#include "SimReply.h"
#include "SimSegmentFile.h"
#include "SimSegmentSearch.h"
#include "SimSegmentWork.h"
#include "support/LispList.h"
#include "support/ParserExpression.h"

namespace {

constexpr std::string_view kSegmentPrefix = ":EDIT:SEGM";
// What the other handles hear when the saved segments change.
constexpr const char* kCatalogHeader = ":EDIT:SEGM:CAT";
constexpr const char* kExtension = ".qseg";
constexpr std::size_t kMaxNameLength = 200;
// Characters a segment name may not hold: it becomes a file name and travels in quotes.
constexpr std::string_view kForbidden = "\"*?<>|:;";

Dstring Quote(const Dstring& text) {
  Dstring out = "\"";
  for (char c : text) out += c == '"' ? Dstring("\"\"") : Dstring(1, c);
  return out + "\"";
}

Dstring Position(long trace, long vector) {
  return Dstring::Format("%ld,%ld", trace, vector);
}

// The word after a command's numbers, upper case; empty when it is not a word.
Dstring WordAt(const DataParcel& items, std::size_t at) {
  return at < items.size() && items[at].GetType() == DataItemType::Word
             ? Dstring(items[at].GetText()).ToUpper()
             : Dstring();
}

}  // namespace

const SimSegmentStore::StoreEntry SimSegmentStore::kStoreCommands[] = {
    {":EDIT:SEGM:OPEN", &SimSegmentStore::Open, nullptr},
    {":EDIT:SEGM:RPAT", &SimSegmentStore::RealPath, nullptr},
    {":EDIT:SEGM:CRE", &SimSegmentStore::Create, nullptr},
    {":EDIT:SEGM:EXIS", &SimSegmentStore::Exists, nullptr},
    {":EDIT:SEGM:CAT", &SimSegmentStore::Catalog, nullptr},
    {":EDIT:SEGM:PACE", nullptr, &SimSegmentStore::Pace},
    {":EDIT:SEGM:DEL", nullptr, &SimSegmentStore::Delete},
    {":EDIT:SEGM:PATT:CLIP", &SimSegmentStore::ClipFilled, nullptr},
    {":EDIT:SEGM:PATT:CLIP:WIDT", &SimSegmentStore::ClipWidth, nullptr},
    {":EDIT:SEGM:PATT:CLIP:LENG", &SimSegmentStore::ClipLength, nullptr},
    {":EDIT:SEGM:PATT:CLIP:COD", &SimSegmentStore::ClipCoding, nullptr},
    {":MMEM:INF", &SimSegmentStore::FileInfo, nullptr},
};

const SimSegmentStore::SegmentEntry SimSegmentStore::kSegmentCommands[] = {
    {":CLOS", nullptr, &SimSegmentStore::Close, false},
    {":SAVE", nullptr, &SimSegmentStore::Save, false},
    {":TYPE", &SimSegmentStore::QueryType, &SimSegmentStore::WriteType, true},
    {":PARA", &SimSegmentStore::QueryParam, &SimSegmentStore::WriteParam, true},
    {":PATT:LENG", &SimSegmentStore::QueryLength, nullptr, false},
    {":PATT:WIDT", &SimSegmentStore::QueryWidth, nullptr, false},
    {":PATT:COD", &SimSegmentStore::QueryCoding, &SimSegmentStore::WriteCoding, true},
    {":PATT:DATA", &SimSegmentStore::QueryData, &SimSegmentStore::WriteData, true},
    {":PATT:MOD:FILL", nullptr, &SimSegmentStore::Fill, true},
    {":PATT:MOD:INV", nullptr, &SimSegmentStore::Invert, true},
    {":PATT:MOD:MIRR", nullptr, &SimSegmentStore::Mirror, true},
    {":PATT:MOD:COPY", nullptr, &SimSegmentStore::Copy, false},
    {":PATT:MOD:PASTE", nullptr, &SimSegmentStore::Paste, true},
    {":PATT:MOD:INS", nullptr, &SimSegmentStore::Insert, true},
    {":PATT:MOD:DEL", nullptr, &SimSegmentStore::Remove, true},
    {":PATT:MOD:SER", nullptr, &SimSegmentStore::Serialize, true},
    {":PATT:MOD:DES", nullptr, &SimSegmentStore::Deserialize, true},
    {":PATT:MOD:CONV", nullptr, &SimSegmentStore::Convert, true},
    {":PATT:FIND:FIRS", &SimSegmentStore::FindFirst, nullptr, false},
    {":PATT:FIND:NEXT", &SimSegmentStore::FindNext, nullptr, false},
    {":PATT:FIND:PREV", &SimSegmentStore::FindPrevious, nullptr, false},
    {":PATT:ERR:FIRS", &SimSegmentStore::ErrorFirst, nullptr, false},
    {":PATT:ERR:NEXT", &SimSegmentStore::ErrorNext, nullptr, false},
    {":PATT:ERR:PREV", &SimSegmentStore::ErrorPrevious, nullptr, false},
};

SimSegmentStore::SimSegmentStore(const Dstring& dataDir) {
  if (!dataDir.empty()) mDir = std::filesystem::path(dataDir.c_str()) / "segments";
}

bool SimSegmentStore::RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) {
  for (const StoreEntry& e : kStoreCommands) {
    if (rest != e.path) continue;
    const StoreHandler handler = cmd.IsQuery() ? e.query : e.write;
    const int rc = handler == nullptr ? (cmd.IsQuery() ? -113 : -200) : (this->*handler)(cmd, context);
    if (rc != 0) context.Error(rc);
    return true;
  }
  return RunSegmentCommand(rest, cmd, context);
}

// ":EDIT:SEGM<n><tail>": the number of an open segment, then one of its commands.
bool SimSegmentStore::RunSegmentCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) {
  if (!rest.StartsWith(kSegmentPrefix)) return false;
  std::size_t end = kSegmentPrefix.size();
  while (end < rest.size() && rest[end] >= '0' && rest[end] <= '9') ++end;
  unsigned long number = 0;
  if (end == kSegmentPrefix.size() ||
      !Dstring(rest.substr(kSegmentPrefix.size(), end - kSegmentPrefix.size())).ToULong(number))
    return false;
  const Dstring tail = rest.substr(end);
  for (const SegmentEntry& e : kSegmentCommands) {
    if (tail != e.path) continue;
    auto open = mOpen.find(static_cast<unsigned>(number));
    const SegmentHandler handler = cmd.IsQuery() ? e.query : e.write;
    int rc = open == mOpen.end() || number > UINT_MAX ? -113
             : handler == nullptr                     ? (cmd.IsQuery() ? -113 : -200)
                                                      : 0;
    // The handler may close the segment: it keeps its own reference while it runs.
    std::shared_ptr<SimSegment> segment = rc == 0 ? open->second.segment : nullptr;
    if (rc == 0) rc = (this->*handler)(static_cast<unsigned>(number), *segment, cmd, context);
    if (rc != 0) context.Error(rc);
    if (rc == 0 && e.changes && !cmd.IsQuery()) context.MarkChanged(Dstring::Format(":EDIT:SEGM%lu", number));
    return true;
  }
  return false;
}

int SimSegmentStore::Args(const SimCommand& cmd, DataParcel& items, std::size_t min, std::size_t max) {
  ConditionList ignored;
  if (!cmd.HasArgs()) return min == 0 ? 0 : -109;
  if (ParserExpression::Parse(cmd.GetArgs(), items, ignored) != 0 || items.size() > max) return -104;
  return items.size() < min ? -109 : 0;
}

int SimSegmentStore::Name(const SimCommand& cmd, Dstring& name) {
  DataParcel items;
  if (int rc = Args(cmd, items, 1, 1)) return rc;
  if (items[0].GetType() != DataItemType::String) return -104;
  name = Dstring(items[0].GetText());
  return 0;
}

int SimSegmentStore::Longs(const DataParcel& items, std::size_t from, std::size_t count, long* out) {
  for (std::size_t i = 0; i < count; ++i) {
    if (from + i >= items.size()) return -109;
    if (!items[from + i].IsInteger() || !items[from + i].GetLong(out[i])) return -104;
  }
  return 0;
}

bool SimSegmentStore::PathOf(const Dstring& name, std::filesystem::path& path) const {
  if (mDir.empty() || name.empty() || name.size() > kMaxNameLength) return false;
  std::filesystem::path relative;
  Dstring part;
  for (std::size_t i = 0; i <= name.size(); ++i) {
    const char c = i < name.size() ? name[i] : '/';
    if (static_cast<unsigned char>(c) < 0x20 || kForbidden.find(c) != std::string_view::npos) return false;
    if (c != '/' && c != '\\') {
      part += c;
      continue;
    }
    if (part.empty() || part == "." || part == "..") return false;
    relative /= part.c_str();
    part.clear();
  }
  path = mDir / relative;
  path += kExtension;
  return true;
}

unsigned SimSegmentStore::NumberOf(const Dstring& name) const {
  for (const auto& [number, open] : mOpen) {
    if (open.segment->GetName() == name) return number;
  }
  return 0;
}

unsigned SimSegmentStore::Remember(std::shared_ptr<SimSegment> segment) {
  const unsigned number = mNextNumber++;
  mOpen[number] = OpenSegment{std::move(segment), 1};
  return number;
}

// A name without a file yet opens as a new, empty segment of memory data.
int SimSegmentStore::Open(const SimCommand& cmd, SimContext& context) {
  Dstring name;
  std::filesystem::path path;
  if (int rc = Name(cmd, name)) return rc;
  if (unsigned number = NumberOf(name)) {
    ++mOpen[number].count;
    context.Reply(Dstring::Format("%u", number));
    return 0;
  }
  const bool named = PathOf(name, path);
  if (!named && !mDir.empty()) return -224;
  auto segment = std::make_shared<SimSegment>(name);
  const int rc = named ? SimSegmentFile::Load(path.string(), *segment) : -256;
  if (rc != 0 && rc != -256) return rc;
  context.Reply(Dstring::Format("%u", Remember(std::move(segment))));
  return 0;
}

std::shared_ptr<const SimSegment> SimSegmentStore::Find(const Dstring& name) const {
  if (unsigned number = NumberOf(name)) return mOpen.at(number).segment;
  std::filesystem::path path;
  auto segment = std::make_shared<SimSegment>(name);
  if (!PathOf(name, path) || SimSegmentFile::Load(path.string(), *segment) != 0) return nullptr;
  return segment;
}

int SimSegmentStore::RealPath(const SimCommand& cmd, SimContext& context) {
  Dstring name;
  std::filesystem::path path;
  if (int rc = Name(cmd, name)) return rc;
  if (!PathOf(name, path)) return -224;
  context.Reply(Quote(path.string()));
  return 0;
}

// The new segment is saved at once, so that it exists; the number returned holds it open.
int SimSegmentStore::Create(const SimCommand& cmd, SimContext& context) {
  DataParcel items;
  std::filesystem::path path;
  if (int rc = Args(cmd, items, 2, 2)) return rc;
  if (items[0].GetType() != DataItemType::String || !items[1].IsText()) return -104;
  const Dstring name(items[0].GetText());
  if (!PathOf(name, path)) return -224;
  if (NumberOf(name) != 0) return -200;
  auto segment = std::make_shared<SimSegment>(name);
  if (int rc = segment->SetType(Dstring(items[1].GetText()).ToUpper())) return rc;
  if (!SimSegmentFile::Save(*segment, path.string())) return -200;
  context.Reply(Dstring::Format("%u", Remember(std::move(segment))));
  context.MarkChanged(kCatalogHeader);
  return 0;
}

int SimSegmentStore::Exists(const SimCommand& cmd, SimContext& context) {
  Dstring name;
  std::filesystem::path path;
  if (int rc = Name(cmd, name)) return rc;
  std::error_code error;
  context.Reply(PathOf(name, path) && std::filesystem::is_regular_file(path, error) ? "TRUE" : "FALSE");
  return 0;
}

// The saved segments of the data directory, sub-folders as "dir/name", quoted and sorted.
int SimSegmentStore::Catalog(const SimCommand&, SimContext& context) {
  std::vector<std::string> names;
  std::error_code error;
  if (!mDir.empty()) {
    for (auto it = std::filesystem::recursive_directory_iterator(mDir, error);
         !error && it != std::filesystem::recursive_directory_iterator(); it.increment(error)) {
      if (!it->is_regular_file(error) || it->path().extension() != kExtension) continue;
      std::filesystem::path relative = it->path().lexically_relative(mDir);
      relative.replace_extension();
      names.push_back(relative.generic_string());
    }
  }
  std::sort(names.begin(), names.end());
  Dstring reply;
  for (const std::string& name : names) reply += (reply.empty() ? "\"" : ",\"") + name + "\"";
  context.Reply(reply);
  return 0;
}

int SimSegmentStore::Pace(const SimCommand& cmd, SimContext& context) {
  if (!context.TestControl()) return -113;
  long ms = 0;
  if (!Dstring(cmd.GetArgs()).ToLong(ms) || ms < 0 || ms > 60000) return -222;
  mPaceMs = static_cast<int>(ms);
  return 0;
}

int SimSegmentStore::Delete(const SimCommand& cmd, SimContext& context) {
  Dstring name;
  std::filesystem::path path;
  if (int rc = Name(cmd, name)) return rc;
  if (!PathOf(name, path)) return -224;
  if (NumberOf(name) != 0) return -200;
  std::error_code error;
  if (!std::filesystem::remove(path, error)) return -256;
  context.MarkChanged(kCatalogHeader);
  return 0;
}

// Only files of the data directory are told about: "size,"modified"".
int SimSegmentStore::FileInfo(const SimCommand& cmd, SimContext& context) {
  Dstring text;
  if (int rc = Name(cmd, text)) return rc;
  const std::filesystem::path path = std::filesystem::path(text.c_str()).lexically_normal();
  const std::filesystem::path inside = path.lexically_relative(mDir.parent_path());
  std::error_code error;
  if (mDir.empty() || inside.empty() || *inside.begin() == ".." ||
      !std::filesystem::is_regular_file(path, error))
    return -256;
  const auto size = std::filesystem::file_size(path, error);
  const auto written = std::chrono::file_clock::to_sys(std::filesystem::last_write_time(path, error));
  const std::time_t seconds = std::chrono::system_clock::to_time_t(written);
  char stamp[32];
  std::strftime(stamp, sizeof stamp, "%Y-%m-%dT%H:%M:%S", std::gmtime(&seconds));
  if (error) return -256;
  context.Reply(Dstring::Format("%ju,\"%s\"", static_cast<std::uintmax_t>(size), stamp));
  return 0;
}

int SimSegmentStore::ClipFilled(const SimCommand&, SimContext& context) {
  context.Reply(mClip.filled ? "TRUE" : "FALSE");
  return 0;
}

int SimSegmentStore::ClipWidth(const SimCommand&, SimContext& context) {
  context.Reply(Dstring::Format("%ld", mClip.rows.GetWidth()));
  return 0;
}

int SimSegmentStore::ClipLength(const SimCommand&, SimContext& context) {
  context.Reply(Dstring::Format("%ld", mClip.rows.GetLength()));
  return 0;
}

int SimSegmentStore::ClipCoding(const SimCommand&, SimContext& context) {
  context.Reply(Quote(mClip.coding));
  return 0;
}

int SimSegmentStore::Close(unsigned number, SimSegment&, const SimCommand& cmd, SimContext&) {
  if (cmd.HasArgs()) return -104;
  if (--mOpen[number].count <= 0) mOpen.erase(number);
  return 0;
}

// "SAVE" writes the segment's own file, "SAVE "name"" a copy under another name.
int SimSegmentStore::Save(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext& context) {
  Dstring name = segment.GetName();
  std::filesystem::path path;
  if (cmd.HasArgs()) {
    if (int rc = Name(cmd, name)) return rc;
  }
  if (!PathOf(name, path)) return mDir.empty() ? -200 : -224;
  std::error_code error;
  const bool listed = std::filesystem::is_regular_file(path, error);
  if (!SimSegmentFile::Save(segment, path.string())) return -200;
  if (!listed) context.MarkChanged(kCatalogHeader);
  return 0;
}

int SimSegmentStore::QueryType(unsigned, SimSegment& segment, const SimCommand&, SimContext& context) {
  context.Reply(segment.GetType());
  return 0;
}

int SimSegmentStore::WriteType(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext&) {
  DataParcel items;
  if (int rc = Args(cmd, items, 1, 1)) return rc;
  if (!items[0].IsText()) return -104;
  return segment.SetType(Dstring(items[0].GetText()).ToUpper());
}

int SimSegmentStore::QueryParam(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext& context) {
  Dstring name, value;
  if (int rc = Name(cmd, name)) return rc;
  if (int rc = segment.GetParam(name, value)) return rc;
  context.Reply(value);
  return 0;
}

// "name",(value): the value is one parenthesised list.
int SimSegmentStore::WriteParam(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext&) {
  LispList items;
  ConditionList ignored;
  if (!cmd.HasArgs()) return -109;
  if (ParserExpression::Parse(cmd.GetArgs(), items, ignored) != 0) return -104;
  if (items.Size() != 2) return items.Size() < 2 ? -109 : -104;
  if (!items[0].IsItem() || items[0].GetItem().GetType() != DataItemType::String || !items[1].IsList())
    return -104;
  return segment.SetParam(Dstring(items[0].GetItem().GetText()), items[1].AsExpression());
}

int SimSegmentStore::QueryLength(unsigned, SimSegment& segment, const SimCommand&, SimContext& context) {
  context.Reply(Dstring::Format("%ld", segment.GetLength()));
  return 0;
}

int SimSegmentStore::QueryWidth(unsigned, SimSegment& segment, const SimCommand&, SimContext& context) {
  context.Reply(Dstring::Format("%ld", segment.GetWidth()));
  return 0;
}

int SimSegmentStore::QueryCoding(unsigned, SimSegment& segment, const SimCommand&, SimContext& context) {
  context.Reply(Quote(segment.GetCoding()));
  return 0;
}

int SimSegmentStore::WriteCoding(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext&) {
  Dstring coding;
  if (int rc = Name(cmd, coding)) return rc;
  return segment.SetCoding(coding);
}

// first trace, first vector, last trace, last vector, BIN
int SimSegmentStore::QueryData(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext& context) {
  DataParcel items;
  long range[4];
  if (int rc = Args(cmd, items, 5, 5)) return rc;
  if (int rc = Longs(items, 0, 4, range)) return rc;
  if (WordAt(items, 4) != "BIN") return -224;
  Dstring reply;
  if (int rc = segment.ReadBlock(range[0], range[1], range[2], range[3], reply, true)) return rc;
  context.Reply(std::move(reply));
  return 0;
}

int SimSegmentStore::WriteData(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext&) {
  DataParcel items;
  long range[4];
  // The usual shape has only the range parsed: the block is written from where it stands.
  std::string_view head;
  std::string_view bytes;
  ConditionList ignored;
  if (cmd.SplitTrailingBlock(head, bytes) && ParserExpression::Parse(head, items, ignored) == 0 && items.size() == 4) {
    if (int rc = Longs(items, 0, 4, range)) return rc;
    return segment.WriteBlock(range[0], range[1], range[2], range[3], bytes);
  }
  if (int rc = Args(cmd, items, 5, 5)) return rc;
  if (int rc = Longs(items, 0, 4, range)) return rc;
  if (items[4].GetType() != DataItemType::Block) return -104;
  return segment.WriteBlock(range[0], range[1], range[2], range[3], items[4].GetText());
}

int SimSegmentStore::Fill(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext& context) {
  DataParcel items;
  long v[5];
  if (int rc = Args(cmd, items, 5, 5)) return rc;
  if (int rc = Longs(items, 0, 5, v)) return rc;
  return SimSegmentWork(context, mPaceMs).Fill(segment, v[0], v[1], v[2], v[3], v[4]);
}

int SimSegmentStore::Invert(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext& context) {
  DataParcel items;
  long v[4];
  if (int rc = Args(cmd, items, 4, 4)) return rc;
  if (int rc = Longs(items, 0, 4, v)) return rc;
  return SimSegmentWork(context, mPaceMs).Invert(segment, v[0], v[1], v[2], v[3]);
}

int SimSegmentStore::Mirror(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext&) {
  DataParcel items;
  long v[4];
  if (int rc = Args(cmd, items, 5, 5)) return rc;
  if (int rc = Longs(items, 0, 4, v)) return rc;
  const Dstring mode = WordAt(items, 4);
  if (mode != "TRAC" && mode != "VECT") return -224;
  return segment.Mirror(v[0], v[1], v[2], v[3], mode == "TRAC");
}

int SimSegmentStore::Copy(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext&) {
  DataParcel items;
  long v[4];
  if (int rc = Args(cmd, items, 4, 4)) return rc;
  if (int rc = Longs(items, 0, 4, v)) return rc;
  return segment.Copy(v[0], v[1], v[2], v[3], mClip);
}

// trace, vector, RVS
int SimSegmentStore::Paste(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext&) {
  DataParcel items;
  long v[2];
  if (int rc = Args(cmd, items, 3, 3)) return rc;
  if (int rc = Longs(items, 0, 2, v)) return rc;
  if (WordAt(items, 2) != "RVS") return -224;
  return segment.Paste(mClip, v[0], v[1]);
}

// position, VECT|TRAC, BEF|AFT, count
int SimSegmentStore::Insert(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext& context) {
  DataParcel items;
  long position = 0, count = 0;
  if (int rc = Args(cmd, items, 4, 4)) return rc;
  if (int rc = Longs(items, 0, 1, &position)) return rc;
  if (int rc = Longs(items, 3, 1, &count)) return rc;
  const Dstring which = WordAt(items, 1), mode = WordAt(items, 2);
  if ((which != "VECT" && which != "TRAC") || (mode != "BEF" && mode != "AFT")) return -224;
  return SimSegmentWork(context, mPaceMs).Insert(segment, position, which == "VECT", mode == "AFT", count);
}

// position, VECT|TRAC, count[, NORM|CLR]
int SimSegmentStore::Remove(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext&) {
  DataParcel items;
  long position = 0, count = 0;
  if (int rc = Args(cmd, items, 3, 4)) return rc;
  if (int rc = Longs(items, 0, 1, &position)) return rc;
  if (int rc = Longs(items, 2, 1, &count)) return rc;
  const Dstring which = WordAt(items, 1), mode = items.size() == 4 ? WordAt(items, 3) : Dstring("NORM");
  if ((which != "VECT" && which != "TRAC") || (mode != "NORM" && mode != "CLR")) return -224;
  return segment.Delete(position, which == "VECT", count, mode == "CLR");
}

int SimSegmentStore::Serialize(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext&) {
  DataParcel items;
  if (int rc = Args(cmd, items, 1, 1)) return rc;
  const Dstring direction = WordAt(items, 0);
  if (direction != "LSB" && direction != "MSB") return -224;
  return segment.Serialize(direction == "MSB");
}

int SimSegmentStore::Deserialize(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext&) {
  DataParcel items;
  long v[2];
  if (int rc = Args(cmd, items, 2, 2)) return rc;
  if (int rc = Longs(items, 0, 2, v)) return rc;
  return segment.Deserialize(v[0], v[1]);
}

int SimSegmentStore::Convert(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext&) {
  DataParcel items;
  if (int rc = Args(cmd, items, 2, 2)) return rc;
  if (items[0].GetType() != DataItemType::String || items[1].GetType() != DataItemType::String) return -104;
  return segment.Convert(Dstring(items[0].GetText()), Dstring(items[1].GetText()));
}

// [trace, vector,] "pattern", VECT|TRAC, RVS
int SimSegmentStore::Find(const SimSegment& segment, const SimCommand& cmd, const Dstring& direction,
                          SimContext& context) {
  DataParcel items;
  const std::size_t at = direction == "FIRS" ? 0 : 2;
  long start[2] = {0, 0};
  Dstring bits;
  if (int rc = Args(cmd, items, at + 3, at + 3)) return rc;
  if (int rc = Longs(items, 0, at, start)) return rc;
  if (items[at].GetType() != DataItemType::String) return -104;
  const Dstring which = WordAt(items, at + 1);
  if (!SimSegmentSearch::ParsePattern(Dstring(items[at].GetText()), bits)) return -224;
  if ((which != "VECT" && which != "TRAC") || WordAt(items, at + 2) != "RVS") return -224;
  long trace = -1, vector = -1;
  SimSegmentWork work(context, mPaceMs);
  const auto step = [&work](long long done, long long total) { return work.Step(done, total); };
  if (!SimSegmentSearch::Find(segment, bits, which == "TRAC", direction, start[0], start[1], trace, vector, step))
    return SimContext::kCancelled;
  context.Reply(Position(trace, vector));
  return 0;
}

int SimSegmentStore::FindFirst(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext& context) {
  return Find(segment, cmd, "FIRS", context);
}

int SimSegmentStore::FindNext(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext& context) {
  return Find(segment, cmd, "NEXT", context);
}

int SimSegmentStore::FindPrevious(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext& context) {
  return Find(segment, cmd, "PREV", context);
}

// [trace, vector,] RVS
int SimSegmentStore::FindErrorFrom(const SimSegment& segment, const SimCommand& cmd, const Dstring& direction,
                                   SimContext& context) {
  DataParcel items;
  const std::size_t at = direction == "FIRS" ? 0 : 2;
  long start[2] = {0, 0};
  if (int rc = Args(cmd, items, at + 1, at + 1)) return rc;
  if (int rc = Longs(items, 0, at, start)) return rc;
  if (WordAt(items, at) != "RVS") return -224;
  long trace = -1, vector = -1;
  SimSegmentWork work(context, mPaceMs);
  const auto step = [&work](long long done, long long total) { return work.Step(done, total); };
  if (!SimSegmentSearch::FindError(segment, direction, start[0], start[1], trace, vector, step))
    return SimContext::kCancelled;
  context.Reply(Position(trace, vector));
  return 0;
}

int SimSegmentStore::ErrorFirst(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext& context) {
  return FindErrorFrom(segment, cmd, "FIRS", context);
}

int SimSegmentStore::ErrorNext(unsigned, SimSegment& segment, const SimCommand& cmd, SimContext& context) {
  return FindErrorFrom(segment, cmd, "NEXT", context);
}

int SimSegmentStore::ErrorPrevious(unsigned, SimSegment& segment, const SimCommand& cmd,
                                   SimContext& context) {
  return FindErrorFrom(segment, cmd, "PREV", context);
}
