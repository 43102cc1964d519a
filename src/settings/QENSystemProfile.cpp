#include "settings/QENSystemProfile.h"

#include "instrument/CommandText.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "settings/ProfileValue.h"
#include "settings/SettingsStatus.h"
#include "support/ConditionListLoader.h"
#include "support/ParserExpression.h"

namespace {

using Outcome = ProfileValue::Outcome;

int Unexpected(const Dstring& name, const Dstring& reply, ConditionList& list) {
  ConditionListLoader::ConditionToken(list, "GUI_SYSTEM_PROFILE_UNEXPEXPECTED_VALUE", {name, reply},
                                      SettingsStatus::kUnexpectedValue);
  return SettingsStatus::kUnexpectedValue;
}

Outcome ReadReply(const Dstring& reply, Dstring& value) {
  return ProfileValue::ReadText(reply, value);
}

template <typename T>
Outcome ReadReply(const Dstring& reply, T& value) {
  return ProfileValue::Read(reply, value);
}

}  // namespace

int QENSystemProfile::Exists(const Dstring& name, int& exists, ConditionList& list) {
  DstringList names;
  if (int status = Names(names, list)) return status;
  exists = names.Contains(name) ? 1 : 0;
  return QenStatus::kOk;
}

int QENSystemProfile::Names(DstringList& out, ConditionList& list) {
  Dstring reply;
  const Dstring cmd = Dstring::Format("%s:CONF:PROF:LIST?", QenGuiInst::GetAppHandle().c_str());
  if (int status = QenGuiInst::Call(cmd, reply, list)) return status;
  DataParcel names;
  ConditionList parser;
  bool ok = ParserExpression::Parse(reply, names, parser) == 0;
  // A name is any plain item, quoted or not, as its text.
  for (const DataItem& item : names) ok = ok && item.GetType() != DataItemType::Block;
  if (!ok) {
    ConditionListLoader::ConditionToken(list, "GUI_SYSTEM_PROFILE_BAD_LIST", {reply},
                                        SettingsStatus::kBadReply);
    return SettingsStatus::kBadReply;
  }
  out.clear();
  for (const DataItem& item : names) out.push_back(Dstring(item.GetText()));
  return QenStatus::kOk;
}

int QENSystemProfile::Query(const Dstring& name, Dstring& reply, ConditionList& list) {
  if (int status = CommandText::CheckArgument(name, list)) return status;
  const Dstring cmd =
      Dstring::Format("%s:CONF:PROF? \"%s\"", QenGuiInst::GetAppHandle().c_str(), name.c_str());
  return QenGuiInst::Call(cmd, reply, list);
}

template <typename T>
int QENSystemProfile::GetTyped(const Dstring& name, T& value, ConditionList& list) {
  Dstring reply;
  if (int status = Query(name, reply, list)) return status;
  return ReadReply(reply, value) == Outcome::kRead ? QenStatus::kOk : Unexpected(name, reply, list);
}

int QENSystemProfile::Put(const Dstring& name, const Dstring& valueText, ConditionList& list) {
  if (int status = CommandText::CheckArgument(name, list)) return status;
  if (int status = CommandText::CheckValue(valueText, list)) return status;
  Dstring reply;
  const Dstring cmd =
      Dstring::Format("%s:CONF:PROF \"%s\",", QenGuiInst::GetAppHandle().c_str(), name.c_str()) + valueText;
  return QenGuiInst::Call(cmd, reply, list);
}

// A text travels quoted, so that commas and parentheses in it survive.
Dstring QENSystemProfile::TextValue(const Dstring& text) {
  return DataItem::MakeString(text).AsExpression();
}

template class TypedProfile<QENSystemProfile>;
