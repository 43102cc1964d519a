#include "SimSettingStore.h"

#include <algorithm>
#include <filesystem>
#include <map>
#include <set>

#include "SimCabling.h"
#include "SimReply.h"
#include "SimSequence.h"

#include "support/ConditionList.h"
#include "support/DstringList.h"
#include "support/ParserExpression.h"

namespace {

constexpr int kDataType = -104;
constexpr int kMissing = -109;
constexpr int kUndefined = -113;
constexpr int kExecution = -200;
constexpr int kConflict = -221;
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

bool IsQuoted(const LispList& node) { return node.IsItem() && node.GetItem().GetType() == DataItemType::String; }

}  // namespace

const SimSettingStore::Entry SimSettingStore::kCommands[] = {
    {":MMEM:SETT:NEW", nullptr, &SimSettingStore::NewSetting},
    {":MMEM:SETT:LOAD", nullptr, &SimSettingStore::LoadSetting},
    {":MMEM:SETT:SAVE", nullptr, &SimSettingStore::SaveSetting},
    {":MMEM:SETT:CAT", &SimSettingStore::ListSettings, nullptr},
    {":MMEM:SETT:DATA", &SimSettingStore::QueryData, &SimSettingStore::WriteData},
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
  mSequence->Reset(mDefaults);
  mConnections->Reset();
  context.MarkAllDirty();
}

void SimSettingStore::LoadSetting(const SimCommand& cmd, SimContext& context) {
  DataParcel items;
  Dstring path;
  bool cableDelays = false;
  if (int rc = ReadItems(cmd, items, 1, 2)) return context.Error(rc);
  if (int rc = SettingPath(items, path)) return context.Error(rc);
  if (items.size() == 2 && !ReadSwitch(items[1], cableDelays)) return context.Error(kIllegal);
  SettingText text;
  SettingText::Problem problem;
  const Dstring name(items[0].GetText());
  if (int rc = SimSettingFile::Read(path, text, problem)) {
    if (problem.line == 0) return context.Error(rc);
    return context.Error(rc, Dstring::Format("%s, line %d: %s", name.c_str(), problem.line, problem.what.c_str()));
  }
  Dstring detail;
  if (int rc = Apply(text, cableDelays, context, detail)) return context.Error(rc, name + ", " + detail);
  context.MarkAllDirty();
}

void SimSettingStore::SaveSetting(const SimCommand& cmd, SimContext& context) {
  DataParcel items;
  Dstring path;
  if (int rc = ReadItems(cmd, items, 1, 1)) return context.Error(rc);
  if (int rc = SettingPath(items, path)) return context.Error(rc);
  if (int rc = SimSettingFile::Write(path, Capture(context).Write())) context.Error(rc);
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

SettingText SimSettingStore::Capture(SimContext& context) const {
  SettingText text;
  const SimParamTable& params = context.Params();
  for (std::size_t i = 0; i < params.Size(); ++i) {
    if (!params.At(i).IsReadOnly()) text.AddValue(params.At(i).GetHeader(), params.At(i).FormatExact());
  }
  text.SetProfile(mSettingProfile);
  mConnections->Capture(text);
  mSequence->Capture(text);
  return text;
}

// The values are put back as they were saved, not written again: a write rounds to the
// resolution and passes a value on to its coupled partners, so a level derived from others
// (an offset of 0.7555 V from a high level of 1.511 V) would come back changed.
int SimSettingStore::Apply(const SettingText& text, bool cableDelays, SimContext& context, Dstring& detail) {
  SimParamTable table = mDefaults;
  std::map<std::size_t, int> lines;
  for (const SettingText::Value& value : text.GetValues()) {
    std::size_t index = 0;
    // A setting made for another configuration is not this instrument's.
    if (!table.Find(value.header, index)) {
      detail = Dstring::Format("line %d: this instrument has no parameter %s", value.line, value.header.c_str());
      return kStorage;
    }
    const SimParam& param = table.At(index);
    if (param.IsReadOnly() || (!cableDelays && IsCableDelay(param.GetHeader()))) continue;
    if (int rc = table.Restore(index, value.text)) {
      detail = Dstring::Format("line %d: %s does not take %s", value.line, param.GetHeader().c_str(), value.text.c_str());
      return rc;
    }
    lines[index] = value.line;
  }
  const SimParamTable& now = context.Params();
  for (std::size_t i = 0; i < now.Size() && !cableDelays; ++i) {
    std::size_t index = 0;
    if (IsCableDelay(now.At(i).GetHeader()) && table.Find(now.At(i).GetHeader(), index)) {
      table.Restore(index, now.At(i).FormatExact());
      lines[index] = 0;
    }
  }
  std::set<std::size_t> named;
  for (const auto& entry : lines) named.insert(entry.first);
  std::vector<std::size_t> broken;
  if (!table.FinishRestore(named, broken)) {
    DstringList names;
    int line = 0;
    for (std::size_t index : broken) {
      names.push_back(table.At(index).GetHeader());
      line = std::max(line, lines[index]);
    }
    detail = Dstring::Format("line %d: the values of %s do not agree with each other", line != 0 ? line : text.GetEndLine(),
                             names.Join(", ").c_str());
    return kConflict;
  }
  SimCabling::Drivers drivers;
  if (!text.IsLegacy()) {
    if (int rc = mSequence->Check(text, detail)) return rc;
    if (int rc = mConnections->Check(text, drivers, detail)) return rc;
  }
  context.Params() = std::move(table);
  mSettingProfile = text.GetProfile();
  // A setting kept before settings held them leaves the sequence and the connections alone.
  if (!text.IsLegacy()) {
    mSequence->Take(text);
    mConnections->Take(std::move(drivers));
  }
  return 0;
}

void SimSettingStore::QueryData(const SimCommand& cmd, SimContext& context) {
  if (cmd.HasArgs()) return context.Error(kUndefined);
  const Dstring text = Capture(context).Write();
  context.Reply(SimBlockHeader(text.size()) + text);
}

// [ON|OFF,]<block of the setting text>: the choice as for a load, OFF when not given.
void SimSettingStore::WriteData(const SimCommand& cmd, SimContext& context) {
  DataParcel items;
  bool cableDelays = false;
  if (int rc = ReadItems(cmd, items, 1, 2)) return context.Error(rc);
  if (items.back().GetType() != DataItemType::Block) return context.Error(kDataType);
  if (items.size() == 2 && !ReadSwitch(items[0], cableDelays)) return context.Error(kIllegal);
  SettingText text;
  SettingText::Problem problem;
  if (!SettingText::Read(items.back().GetText(), SettingText::Kind::kSetting, text, problem)) {
    return context.Error(kDataType, Dstring::Format("line %d: %s", problem.line, problem.what.c_str()));
  }
  Dstring detail;
  if (int rc = Apply(text, cableDelays, context, detail)) return context.Error(rc, detail);
  context.MarkAllDirty();
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
