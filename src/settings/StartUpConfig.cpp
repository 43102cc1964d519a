#include "settings/StartUpConfig.h"

#include "instrument/CommandText.h"
#include "settings/QENRegistryProfile.h"
#include "settings/RegistryStore.h"
#include "settings/SettingsStatus.h"
#include "support/ConditionListLoader.h"

namespace {

struct StartWord {
  const char* word;
  StartUpConfig::Start start;
};

constexpr StartWord kStartWords[] = {
    {"KEEP", StartUpConfig::Start::kKeepSetting},
    {"NEW", StartUpConfig::Start::kNewSetting},
    {"LOAD", StartUpConfig::Start::kLoadSetting},
};

const char* WordOf(StartUpConfig::Start start) {
  for (const StartWord& s : kStartWords) {
    if (s.start == start) return s.word;
  }
  return kStartWords[0].word;
}

// A value that is not there leaves `value` as it is.
template <typename T>
int ReadIfThere(const Dstring& key, const char* name, T& value, ConditionList& list) {
  void* root = RegistryStore::CurrentUser();
  int exists = 0;
  if (int status = QENRegistryProfile::Exists(root, key, name, exists, list)) return status;
  if (!exists) return 0;
  T read{};
  if (int status = QENRegistryProfile::GetValue(root, key, name, read, list)) return status;
  value = read;
  return 0;
}

}  // namespace

Dstring StartUpConfig::KeyOf(unsigned long paramSet) {
  return Dstring::Format("%s\\StartUpParameterSet%lu", QENRegistryProfile::kGuiKey, paramSet);
}

Dstring StartUpConfig::FormerKeyOf(unsigned long paramSet) {
  return Dstring::Format("%s\\StartUpParameterSet%lu", QENRegistryProfile::kFormerGuiKey, paramSet);
}

int StartUpConfig::Read(unsigned long paramSet, ConditionList& list) {
  *this = StartUpConfig();
  void* root = RegistryStore::CurrentUser();
  Dstring key = KeyOf(paramSet);
  int own = 0, former = 0;
  if (int status = QENRegistryProfile::KeyExists(root, key, own, list)) return status;
  if (!own && QENRegistryProfile::KeyExists(root, FormerKeyOf(paramSet), former, list) == 0 && former) {
    key = FormerKeyOf(paramSet);
  }
  return ReadFrom(key, list);
}

int StartUpConfig::ReadFrom(const Dstring& key, ConditionList& list) {
  unsigned long showDialog = mShowDialog;
  unsigned long cableDelay = mCableDelay;
  Dstring word = WordOf(mStart);
  int first = 0;
  for (int status : {ReadIfThere(key, "ShowDialog", showDialog, list), ReadIfThere(key, "Start", word, list),
                     ReadIfThere(key, "SettingName", mSettingName, list),
                     ReadIfThere(key, "CableDelay", cableDelay, list)}) {
    if (first == 0) first = status;
  }
  mShowDialog = showDialog != 0;
  mCableDelay = cableDelay != 0;
  for (const StartWord& s : kStartWords) {
    if (word.ToUpper() == s.word) {
      mStart = s.start;
      return first;
    }
  }
  ConditionListLoader::ConditionToken(list, "GUI_STARTUP_BAD_START", {word}, SettingsStatus::kBadStartUp);
  return first != 0 ? first : SettingsStatus::kBadStartUp;
}

int StartUpConfig::Write(unsigned long paramSet, ConditionList& list) const {
  void* root = RegistryStore::CurrentUser();
  const Dstring key = KeyOf(paramSet);
  if (int status = QENRegistryProfile::SetValue(root, key, "ShowDialog", mShowDialog ? 1UL : 0UL, list)) return status;
  if (int status = QENRegistryProfile::SetValue(root, key, "Start", Dstring(WordOf(mStart)), list)) return status;
  if (int status = QENRegistryProfile::SetValue(root, key, "SettingName", mSettingName, list)) return status;
  return QENRegistryProfile::SetValue(root, key, "CableDelay", mCableDelay ? 1UL : 0UL, list);
}

int StartUpConfig::Check(ConditionList& list) const {
  if (mStart != Start::kLoadSetting) return 0;
  if (mSettingName.Trimmed().empty()) {
    ConditionListLoader::ConditionToken(list, "GUI_STARTUP_NO_SETTING_NAME", {}, SettingsStatus::kBadStartUp);
    return SettingsStatus::kBadStartUp;
  }
  return CommandText::CheckArgument(mSettingName, list);
}
