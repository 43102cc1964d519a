#include "settings/QENRegistryProfile.h"


#include "settings/FileRegistryStore.h"
#include "settings/ProfileValue.h"
#include "settings/SettingsStatus.h"
#include "support/ConditionListLoader.h"

RegistryStore* QENRegistryProfile::mStore = nullptr;

void QENRegistryProfile::SetStore(RegistryStore* store) { mStore = store; }

RegistryStore& QENRegistryProfile::GetStore() {
  static FileRegistryStore platform(FileRegistryStore::DefaultPath());
  return mStore ? *mStore : platform;
}

int QENRegistryProfile::Exists(void* root, const Dstring& key, const Dstring& name, int& exists,
                               ConditionList& list) {
  bool found = false;
  if (int status = GetStore().HasValue(root, key, name, found, list)) return status;
  exists = found;
  return 0;
}

int QENRegistryProfile::KeyExists(void* root, const Dstring& key, int& exists, ConditionList& list) {
  bool found = false;
  if (int status = GetStore().HasKey(root, key, found, list)) return status;
  exists = found;
  return 0;
}

int QENRegistryProfile::DeleteKey(void* root, const Dstring& key, ConditionList& list) {
  return GetStore().DeleteKey(root, key, list);
}

int QENRegistryProfile::DeleteValue(void* root, const Dstring& key, const Dstring& name, ConditionList& list) {
  return GetStore().DeleteValue(root, key, name, list);
}

template <typename T>
int QENRegistryProfile::GetTyped(void* root, const Dstring& key, const Dstring& name, T& value,
                                 ConditionList& list) {
  Dstring data;
  if (int status = GetStore().Query(root, key, name, data, list)) return status;
  if (ProfileValue::Read(data, value) == ProfileValue::Outcome::kRead) return 0;
  ConditionListLoader::ConditionToken(list, "GUI_REGISTRY_PROFILE_UNEXPEXPECTED_VALUEDATA", {name, data},
                                      SettingsStatus::kUnexpectedValue);
  return SettingsStatus::kUnexpectedValue;
}

int QENRegistryProfile::GetValue(void* root, const Dstring& key, const Dstring& name, long& value,
                                 ConditionList& list) {
  return GetTyped(root, key, name, value, list);
}

int QENRegistryProfile::GetValue(void* root, const Dstring& key, const Dstring& name, unsigned long& value,
                                 ConditionList& list) {
  return GetTyped(root, key, name, value, list);
}

int QENRegistryProfile::GetValue(void* root, const Dstring& key, const Dstring& name, float& value,
                                 ConditionList& list) {
  return GetTyped(root, key, name, value, list);
}

int QENRegistryProfile::GetValue(void* root, const Dstring& key, const Dstring& name, double& value,
                                 ConditionList& list) {
  return GetTyped(root, key, name, value, list);
}

// A text value is the data itself.
int QENRegistryProfile::GetValue(void* root, const Dstring& key, const Dstring& name, Dstring& value,
                                 ConditionList& list) {
  return GetStore().Query(root, key, name, value, list);
}

int QENRegistryProfile::GetValue(void* root, const Dstring& key, const Dstring& name, DataParcel& value,
                                 ConditionList& list) {
  return GetTyped(root, key, name, value, list);
}

int QENRegistryProfile::GetValue(void* root, const Dstring& key, const Dstring& name, LispList& value,
                                 ConditionList& list) {
  return GetTyped(root, key, name, value, list);
}

int QENRegistryProfile::SetValue(void* root, const Dstring& key, const Dstring& name, long value,
                                 ConditionList& list) {
  return GetStore().Set(root, key, name, ProfileValue::Format(value, false), list);
}

int QENRegistryProfile::SetValue(void* root, const Dstring& key, const Dstring& name, unsigned long value,
                                 ConditionList& list) {
  return GetStore().Set(root, key, name, ProfileValue::Format(value, false), list);
}

int QENRegistryProfile::SetValue(void* root, const Dstring& key, const Dstring& name, float value,
                                 ConditionList& list) {
  if (int status = ProfileValue::CheckFinite(value, name, list)) return status;
  return GetStore().Set(root, key, name, ProfileValue::Format(value, false), list);
}

int QENRegistryProfile::SetValue(void* root, const Dstring& key, const Dstring& name, double value,
                                 ConditionList& list) {
  if (int status = ProfileValue::CheckFinite(value, name, list)) return status;
  return GetStore().Set(root, key, name, ProfileValue::Format(value, false), list);
}

int QENRegistryProfile::SetValue(void* root, const Dstring& key, const Dstring& name, const Dstring& value,
                                 ConditionList& list) {
  return GetStore().Set(root, key, name, value, list);
}

int QENRegistryProfile::SetValue(void* root, const Dstring& key, const Dstring& name, const DataParcel& value,
                                 ConditionList& list) {
  return GetStore().Set(root, key, name, ProfileValue::Format(value), list);
}

int QENRegistryProfile::SetValue(void* root, const Dstring& key, const Dstring& name, const LispList& value,
                                 ConditionList& list) {
  return GetStore().Set(root, key, name, ProfileValue::Format(value), list);
}
