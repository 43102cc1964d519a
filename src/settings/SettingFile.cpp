#include "settings/SettingFile.h"

#include "instrument/CommandText.h"
#include "instrument/QenGuiInst.h"
#include "settings/QENSystemProfile.h"
#include "settings/SettingMRU.h"
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

int SettingFile::RecordOpen(const Dstring& name, bool cableDelay, SettingMRU& mru, ConditionList& list) {
  int status = QENSystemProfile::SetValue("OPENSETTING_NAME", name, list);
  if (int rc = QENSystemProfile::SetValue("OPENSETTING_CABLEDELAY", cableDelay ? 1UL : 0UL, list); status == 0) status = rc;
  if (int rc = mru.Record(name, list); status == 0) status = rc;
  return status;
}

int SettingFile::Open(const Dstring& name, bool cableDelay, SettingMRU& mru, ConditionList& list) {
  if (int status = Load(name, cableDelay, list)) return status;
  return RecordOpen(name, cableDelay, mru, list);
}

int SettingFile::Save(const Dstring& name, SettingMRU& mru, ConditionList& list) {
  if (int status = CommandText::CheckArgument(name, list)) return status;
  if (name.Trimmed().empty()) {
    ConditionListLoader::ConditionToken(list, "GUI_SETTING_NO_NAME", {}, 1);
    return 1;
  }
  if (int status = Send(Dstring::Format(":%s:MMEM:SETT:SAVE \"%s\"", Handle(), name.c_str()), list)) return status;
  unsigned long cableDelay = 0;
  ConditionList ignored;
  int exists = 0;
  if (QENSystemProfile::Exists("OPENSETTING_CABLEDELAY", exists, ignored) == 0 && exists) {
    QENSystemProfile::GetValue("OPENSETTING_CABLEDELAY", cableDelay, ignored);
  }
  return RecordOpen(name, cableDelay != 0, mru, list);
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

Dstring SettingFile::CurrentName() {
  Dstring name;
  ConditionList ignored;
  int exists = 0;
  if (QENSystemProfile::Exists("OPENSETTING_NAME", exists, ignored) == 0 && exists) {
    QENSystemProfile::GetValue("OPENSETTING_NAME", name, ignored);
  }
  return name;
}
