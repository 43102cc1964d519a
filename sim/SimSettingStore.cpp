#include "SimSettingStore.h"

#include <algorithm>
#include <filesystem>
#include <set>

#include "support/ConditionList.h"
#include "support/DstringList.h"
#include "support/ParserExpression.h"

namespace {

constexpr int kDataType = -104;
constexpr int kMissing = -109;
constexpr int kUndefined = -113;
constexpr int kExecution = -200;
constexpr int kIllegal = -224;
constexpr int kStorage = -250;
constexpr int kBadFileName = -257;

struct SwitchWord {
  const char* word;
  bool on;
};

constexpr SwitchWord kSwitchWords[] = {{"ON", true}, {"OFF", false}, {"1", true}, {"0", false}};

// The delays that make up for the cables of the rack: with the cable-delay choice off, a load
// keeps the ones the instrument has.
bool IsCableDelay(const Dstring& header) { return header.EndsWith(":PULS:DEL"); }

// The arguments as a flat list of `min`..`max` items: 0, or the SCPI error.
int ReadItems(const SimCommand& cmd, DataParcel& items, std::size_t min, std::size_t max) {
  ConditionList ignored;
  if (!cmd.HasArgs()) return kMissing;
  if (ParserExpression::Parse(cmd.GetArgs(), items, ignored) != 0 || items.size() > max) return kDataType;
  return items.size() < min ? kMissing : 0;
}

bool ReadSwitch(const DataItem& item, bool& on) {
  for (const SwitchWord& s : kSwitchWords) {
    if (Dstring(item.GetText()).ToUpper() == s.word) {
      on = s.on;
      return true;
    }
  }
  return false;
}

using Pending = std::vector<std::pair<std::size_t, Dstring>>;

// A coupled value may be refused until its partners hold theirs: writes in rounds as long as
// any value is taken. 0, or the error of a value that was never taken.
int WriteInRounds(SimParamTable& table, Pending pending) {
  int error = 0;
  while (!pending.empty()) {
    Pending refused;
    for (const auto& entry : pending) {
      if (int rc = table.Write(entry.first, entry.second)) {
        refused.push_back(entry);
        error = rc;
      }
    }
    if (refused.size() == pending.size()) return error;
    pending = std::move(refused);
  }
  return 0;
}

bool IsQuoted(const LispList& node) { return node.IsItem() && node.GetItem().GetType() == DataItemType::String; }

}  // namespace

const SimSettingStore::Entry SimSettingStore::kCommands[] = {
    {":MMEM:SETT:NEW", nullptr, &SimSettingStore::NewSetting},
    {":MMEM:SETT:LOAD", nullptr, &SimSettingStore::LoadSetting},
    {":MMEM:SETT:SAVE", nullptr, &SimSettingStore::SaveSetting},
    {":MMEM:SETT:CAT", &SimSettingStore::ListSettings, nullptr},
    {":CONF:CSET:PROF:EXPR", &SimSettingStore::QuerySettingProfile, &SimSettingStore::WriteSettingProfile},
    {":CONF:PROF", &SimSettingStore::QuerySystemValue, &SimSettingStore::WriteSystemValue},
    {":CONF:PROF:LIST", &SimSettingStore::ListSystemValues, nullptr},
};

bool SimSettingStore::RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) {
  for (const Entry& e : kCommands) {
    if (rest != e.path) continue;
    Handler handler = cmd.IsQuery() ? e.query : e.write;
    if (handler == nullptr) {
      context.Error(cmd.IsQuery() ? kUndefined : kExecution);
    } else {
      (this->*handler)(cmd, context);
    }
    return true;
  }
  return false;
}

void SimSettingStore::NewSetting(const SimCommand& cmd, SimContext& context) {
  if (cmd.HasArgs()) return context.Error(kUndefined);
  context.Params() = mDefaults;
  mSettingProfile.clear();
  context.MarkAllDirty();
}

void SimSettingStore::LoadSetting(const SimCommand& cmd, SimContext& context) {
  DataParcel items;
  Dstring path;
  bool cableDelays = false;
  if (int rc = ReadItems(cmd, items, 1, 2)) return context.Error(rc);
  if (int rc = SettingPath(items, path)) return context.Error(rc);
  if (items.size() == 2 && !ReadSwitch(items[1], cableDelays)) return context.Error(kIllegal);
  SimSettingFile file;
  if (int rc = file.Read(path)) return context.Error(rc);
  if (int rc = Apply(file, cableDelays, context)) return context.Error(rc);
  context.MarkAllDirty();
}

void SimSettingStore::SaveSetting(const SimCommand& cmd, SimContext& context) {
  DataParcel items;
  Dstring path;
  if (int rc = ReadItems(cmd, items, 1, 1)) return context.Error(rc);
  if (int rc = SettingPath(items, path)) return context.Error(rc);
  if (int rc = SimSettingFile::Capture(context.Params(), mSettingProfile).Write(path)) context.Error(rc);
}

void SimSettingStore::ListSettings(const SimCommand& cmd, SimContext& context) {
  if (cmd.HasArgs()) return context.Error(kUndefined);
  std::set<Dstring> names;
  std::error_code error;
  const std::filesystem::path dir = std::filesystem::path(mDataDir.c_str()) / "settings";
  if (!mDataDir.empty() && std::filesystem::is_directory(dir, error)) {
    for (const auto& entry : std::filesystem::directory_iterator(dir, error)) {
      if (entry.path().extension() != ".qset") continue;
      const Dstring name = entry.path().stem().string();
      if (SimSettingFile::IsSettingName(name)) names.insert(name);
    }
  }
  DstringList quoted;
  for (const Dstring& name : names) quoted.push_back("\"" + name + "\"");
  context.Reply(quoted.Join(","));
}

int SimSettingStore::SettingPath(const DataParcel& items, Dstring& path) const {
  if (!items[0].IsText()) return kDataType;
  const Dstring name(items[0].GetText());
  if (!SimSettingFile::IsSettingName(name)) return kBadFileName;
  if (mDataDir.empty()) return kStorage;
  path = SimSettingFile::PathOf(mDataDir, name);
  return 0;
}

int SimSettingStore::Apply(const SimSettingFile& file, bool cableDelays, SimContext& context) {
  SimParamTable table = mDefaults;
  Pending pending;
  for (const auto& [header, text] : file.GetValues()) {
    std::size_t index = 0;
    // A setting made for another configuration is not this instrument's.
    if (!table.Find(header, index)) return kStorage;
    if (!table.At(index).IsReadOnly() && (cableDelays || !IsCableDelay(header))) pending.emplace_back(index, text);
  }
  const SimParamTable& now = context.Params();
  for (std::size_t i = 0; i < now.Size() && !cableDelays; ++i) {
    std::size_t index = 0;
    if (IsCableDelay(now.At(i).GetHeader()) && table.Find(now.At(i).GetHeader(), index)) {
      pending.emplace_back(index, Dstring::Format("%.17g", now.At(i).GetNumber()));
    }
  }
  if (int rc = WriteInRounds(table, std::move(pending))) return rc;
  table.TakeValueChanges();
  table.TakeLimitChanges();
  context.Params() = std::move(table);
  mSettingProfile = file.GetProfile();
  return 0;
}

void SimSettingStore::QuerySettingProfile(const SimCommand&, SimContext& context) { context.Reply(mSettingProfile); }

void SimSettingStore::WriteSettingProfile(const SimCommand& cmd, SimContext& context) {
  LispList parsed;
  ConditionList ignored;
  if (!cmd.HasArgs()) return context.Error(kMissing);
  if (ParserExpression::Parse(cmd.GetArgs(), parsed, ignored) != 0) return context.Error(kDataType);
  mSettingProfile = cmd.GetArgs();
  context.MarkChanged(":CONF:CSET:PROF:EXPR");
}

std::vector<std::pair<Dstring, Dstring>>::iterator SimSettingStore::FindSystemValue(const Dstring& name) {
  return std::find_if(mSystemValues.begin(), mSystemValues.end(), [&](const auto& v) { return v.first == name; });
}

void SimSettingStore::QuerySystemValue(const SimCommand& cmd, SimContext& context) {
  DataParcel items;
  if (int rc = ReadItems(cmd, items, 1, 1)) return context.Error(rc);
  if (items[0].GetType() != DataItemType::String) return context.Error(kDataType);
  auto it = FindSystemValue(Dstring(items[0].GetText()));
  if (it == mSystemValues.end()) return context.Error(kIllegal);
  context.Reply(it->second);
}

// "NAME",VALUE: the value is everything after the name, kept as its expression.
void SimSettingStore::WriteSystemValue(const SimCommand& cmd, SimContext& context) {
  LispList parsed;
  ConditionList ignored;
  if (!cmd.HasArgs()) return context.Error(kMissing);
  if (ParserExpression::Parse(cmd.GetArgs(), parsed, ignored) != 0 || parsed.Size() == 0 || !IsQuoted(parsed[0])) {
    return context.Error(kDataType);
  }
  DstringList parts;
  for (std::size_t i = 1; i < parsed.Size(); ++i) parts.push_back(parsed[i].AsExpression());
  const Dstring value = parts.Join(",");
  const Dstring name(parsed[0].GetItem().GetText());
  if (value.empty()) return context.Error(kMissing);
  if (name.empty()) return context.Error(kIllegal);
  auto it = FindSystemValue(name);
  if (it == mSystemValues.end()) {
    mSystemValues.emplace_back(name, value);
  } else {
    it->second = value;
  }
  context.MarkChanged(":CONF:PROF");
}

void SimSettingStore::ListSystemValues(const SimCommand&, SimContext& context) {
  DstringList names;
  for (const auto& [name, value] : mSystemValues) names.push_back(DataItem::MakeString(name).AsExpression());
  context.Reply(names.Join(","));
}
