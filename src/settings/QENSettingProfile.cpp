#include "settings/QENSettingProfile.h"

#include "data/DirtyFlagDs.h"
#include "instrument/CommandText.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "settings/ProfileValue.h"
#include "settings/SettingsStatus.h"
#include "support/ConditionListLoader.h"
#include "support/LgsDebug.h"
#include "support/ParserExpression.h"

LispList QENSettingProfile::mNameValues;
unsigned QENSettingProfile::mIsDirty = 0;
DirtyFlagDs* QENSettingProfile::mDirtyFlag = nullptr;

namespace {

using Outcome = ProfileValue::Outcome;

LispList NewList() {
  DataItem version;
  DataItem::FromToken("2.0", version);
  LispList out;
  out.Append(version);
  return out;
}

bool IsText(const LispList& node) {
  return node.IsItem() && node.GetItem().IsText();
}

bool IsPair(const LispList& entry) {
  return entry.Size() == 2 && IsText(entry[0]) && IsText(entry[1]);
}

// The entry that names `name`: a list whose first element is that text; 0 when none (the
// version holds place 0).
std::size_t IndexOf(const LispList& values, const Dstring& name) {
  for (std::size_t i = 1; i < values.Size(); ++i) {
    const LispList& entry = values[i];
    if (entry.IsList() && entry.Size() > 0 && IsText(entry[0]) && entry[0].GetItem().GetText() == name)
      return i;
  }
  return 0;
}

int Fail(ConditionList& list, const char* key, std::initializer_list<Dstring> args, int status) {
  ConditionListLoader::ConditionToken(list, key, args, status);
  return status;
}

// Names and texts stand quoted inside the expression sent to the server.
int CheckSendable(const Dstring& text, ConditionList& list) {
  return CommandText::CheckValue(DataItem::MakeString(text).AsExpression(), list);
}

}  // namespace

void QENSettingProfile::Init(DirtyFlagDs* dirtyFlag) {
  mNameValues = NewList();
  mIsDirty = 0;
  mDirtyFlag = dirtyFlag;
  if (mDirtyFlag) mDirtyFlag->RegisterProc(&NfyDirtyFlag, &MatchDirtyFlag, nullptr);
}

void QENSettingProfile::End() {
  if (mDirtyFlag) mDirtyFlag->UnregisterProc(&NfyDirtyFlag, &MatchDirtyFlag, nullptr);
  mDirtyFlag = nullptr;
  mNameValues = NewList();
  mIsDirty = 0;
}

int QENSettingProfile::Read(ConditionList& list) {
  LgsDebug trace("QENSettingProfile::Read ", "settings");
  Dstring reply;
  const Dstring cmd = Dstring::Format("%s:CONF:CSET:PROF:EXPR?", QenGuiInst::GetAppHandle().c_str());
  if (int status = QenGuiInst::Call(cmd, reply, list)) return status;
  LispList parsed;
  ConditionList parser;
  if (ParserExpression::Parse(reply, parsed, parser) != 0) {
    return Fail(list, "GUI_SETTING_PROFILE_SYNTAX", {reply}, SettingsStatus::kBadReply);
  }
  if (parsed.Size() == 0) parsed = NewList();
  mIsDirty = 0;
  if (int status = CheckVersion(parsed, list)) {
    mNameValues = NewList();
    return status;
  }
  mNameValues = std::move(parsed);
  return QenStatus::kOk;
}

int QENSettingProfile::CheckVersion(const LispList& parsed, ConditionList& list) {
  double version = 0;
  const bool number =
      parsed[0].IsItem() && parsed[0].GetItem().IsNumber() && parsed[0].GetItem().GetDouble(version);
  if (number && version == kVersion) return QenStatus::kOk;
  return Fail(list, "GUI_SETTING_PROFILE_WRONG_VERSION", {parsed[0].AsExpression()},
              SettingsStatus::kWrongVersion);
}

int QENSettingProfile::Write(ConditionList& list) {
  LgsDebug trace("QENSettingProfile::Write ", "settings");
  const Dstring expression = mNameValues.AsExpression();
  if (int status = CommandText::CheckValue(expression, list)) return status;
  Dstring reply;
  const Dstring cmd =
      Dstring::Format("%s:CONF:CSET:PROF:EXPR ", QenGuiInst::GetAppHandle().c_str()) + expression;
  if (int status = QenGuiInst::Call(cmd, reply, list)) return status;
  mIsDirty = 0;
  return QenStatus::kOk;
}

int QENSettingProfile::Exists(const Dstring& name, int& exists, ConditionList&) {
  exists = IndexOf(mNameValues, name) != 0;
  return QenStatus::kOk;
}

int QENSettingProfile::FindText(const Dstring& name, Dstring& text, ConditionList& list) {
  std::size_t at = IndexOf(mNameValues, name);
  if (at == 0) return Fail(list, "GUI_SETTING_PROFILE_NO_VALUE", {name}, SettingsStatus::kNoValue);
  const LispList& entry = mNameValues[at];
  if (!IsPair(entry))
    return Fail(list, "GUI_SETTING_PROFILE_BAD_ENTRY", {entry.AsExpression()}, SettingsStatus::kBadEntry);
  text = Dstring(entry[1].GetItem().GetText());
  return QenStatus::kOk;
}

template <typename T>
int QENSettingProfile::GetTyped(const Dstring& name, T& value, ConditionList& list) {
  Dstring text;
  if (int status = FindText(name, text, list)) return status;
  if constexpr (std::is_same_v<T, Dstring>) {
    value = text;  // a text value is the text itself
    return QenStatus::kOk;
  } else {
    switch (ProfileValue::Read(text, value)) {
      case Outcome::kRead:
        return QenStatus::kOk;
      case Outcome::kUnparsable:
        return Fail(list, "GUI_SETTING_PROFILE_BAD_VALUE", {text, name}, SettingsStatus::kBadValue);
      case Outcome::kWrongType:
        break;
    }
    return Fail(list, "GUI_SETTING_PROFILE_UNEXPEXPECTED_VALUE", {name}, SettingsStatus::kUnexpectedValue);
  }
}

int QENSettingProfile::Put(const Dstring& name, const Dstring& text, ConditionList& list) {
  if (int status = CheckSendable(name, list)) return status;
  if (int status = CheckSendable(text, list)) return status;
  LispList entry;
  entry.Append(DataItem::MakeString(name));
  entry.Append(DataItem::MakeString(text));
  std::size_t at = IndexOf(mNameValues, name);
  if (at != 0 && !IsPair(mNameValues[at])) {
    return Fail(list, "GUI_SETTING_PROFILE_BAD_ENTRY", {mNameValues[at].AsExpression()},
                SettingsStatus::kBadEntry);
  }
  if (at == 0) {
    mNameValues.Append(std::move(entry));
  } else {
    mNameValues[at] = std::move(entry);
  }
  mIsDirty = 1;
  return QenStatus::kOk;
}

template class TypedProfile<QENSettingProfile>;

// The name as it stands, or with the handle of this client first (":_H:CONF:CSET:PROF:EXPR").
int QENSettingProfile::MatchDirtyFlag(QenDs*, void*, const Dstring& name) {
  const Dstring upper = name.ToUpper();
  return upper == kChangedName || upper == Dstring(":" + QenGuiInst::GetAppHandle() + kChangedName).ToUpper();
}

// Only the lock stops the pass: a profile that cannot be read must not keep the other
// registrations from hearing of the change.
int QENSettingProfile::NfyDirtyFlag(QenDs*, void*, ConditionList& list) {
  int status = Read(list);
  return status == QenStatus::kLocked || status == QenStatus::kServerTerminated ? status : QenStatus::kOk;
}
