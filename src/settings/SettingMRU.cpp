#include "settings/SettingMRU.h"

#include <algorithm>

#include "settings/QENRegistryProfile.h"
#include "settings/RegistryStore.h"
#include "settings/SettingsStatus.h"
#include "support/ConditionListLoader.h"
#include "support/DataParcel.h"

namespace {

constexpr const char* kValueName = "Settings";

}  // namespace

Dstring SettingMRU::KeyOf(unsigned long paramSet) {
  return Dstring::Format("%s\\ParameterSetMRU%lu", QENRegistryProfile::kGuiKey, paramSet);
}

Dstring SettingMRU::FormerKeyOf(unsigned long paramSet) {
  return Dstring::Format("%s\\ParameterSetMRU%lu", QENRegistryProfile::kFormerGuiKey, paramSet);
}

int SettingMRU::Read(unsigned long paramSet, ConditionList& list) {
  mParamSet = paramSet;
  mNames.clear();
  void* root = RegistryStore::CurrentUser();
  Dstring key = KeyOf(paramSet);
  int own = 0, former = 0;
  if (int status = QENRegistryProfile::Exists(root, key, kValueName, own, list)) return status;
  if (!own && QENRegistryProfile::Exists(root, FormerKeyOf(paramSet), kValueName, former, list) == 0 && former) {
    key = FormerKeyOf(paramSet);
  }
  if (!own && !former) return 0;
  DataParcel items;
  if (int status = QENRegistryProfile::GetValue(root, key, kValueName, items, list)) return status;
  if (!std::all_of(items.begin(), items.end(), [](const DataItem& i) { return i.IsText(); })) {
    ConditionListLoader::ConditionToken(list, "GUI_REGISTRY_PROFILE_UNEXPEXPECTED_VALUEDATA",
                                        {kValueName, items.AsExpression()}, SettingsStatus::kUnexpectedValue);
    return SettingsStatus::kUnexpectedValue;
  }
  // Oldest first, so that the most recent ends in front; Add drops repeats and the surplus.
  for (auto it = items.rbegin(); it != items.rend(); ++it) Add(Dstring(it->GetText()));
  return 0;
}

int SettingMRU::Write(ConditionList& list) const {
  DataParcel items;
  for (const Dstring& name : mNames) items.push_back(DataItem::MakeString(name));
  return QENRegistryProfile::SetValue(RegistryStore::CurrentUser(), KeyOf(mParamSet), kValueName, items, list);
}

void SettingMRU::Add(const Dstring& name) {
  if (name.empty()) return;
  std::erase(mNames, name);
  mNames.insert(mNames.begin(), name);
  if (mNames.size() > kLength) mNames.resize(kLength);
}

int SettingMRU::Record(const Dstring& name, ConditionList& list) {
  Add(name);
  return Write(list);
}
