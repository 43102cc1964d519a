#include "settings/SettingFile.h"

#include "instrument/CommandText.h"
#include "instrument/QenGuiInst.h"
#include "support/ConditionListLoader.h"
#include "support/DataParcel.h"
#include "support/ParserExpression.h"

namespace {

int Send(const Dstring& cmd, ConditionList& list) {
  Dstring reply;
  return QenGuiInst::Call(cmd, reply, list);
}

const char* Handle() { return QenGuiInst::GetAppHandle().c_str(); }

}  // namespace

int SettingFile::New(ConditionList& list) { return Send(Dstring::Format(":%s:MMEM:SETT:NEW", Handle()), list); }

int SettingFile::Load(const Dstring& name, bool cableDelay, ConditionList& list) {
  if (int status = CommandText::CheckArgument(name, list)) return status;
  return Send(Dstring::Format(":%s:MMEM:SETT:LOAD \"%s\", %s", Handle(), name.c_str(), cableDelay ? "ON" : "OFF"), list);
}

int SettingFile::Save(const Dstring& name, ConditionList& list) {
  if (int status = CommandText::CheckArgument(name, list)) return status;
  if (name.Trimmed().empty()) {
    ConditionListLoader::ConditionToken(list, "GUI_SETTING_NO_NAME", {}, 1);
    return 1;
  }
  return Send(Dstring::Format(":%s:MMEM:SETT:SAVE \"%s\"", Handle(), name.c_str()), list);
}

int SettingFile::Catalogue(DstringList& names, ConditionList& list) {
  Dstring reply;
  if (int status = QenGuiInst::Call(Dstring::Format(":%s:MMEM:SETT:CAT?", Handle()), reply, list)) return status;
  DataParcel items;
  if (ParserExpression::Parse(reply, items, list) != 0) return 1;
  names.clear();
  for (const DataItem& item : items) {
    if (!item.GetText().empty()) names.push_back(Dstring(item.GetText()));
  }
  return 0;
}
