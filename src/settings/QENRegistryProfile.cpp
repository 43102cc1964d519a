#include "settings/QENRegistryProfile.h"

#include "settings/FileRegistryStore.h"
#include "settings/ProfileValue.h"
#include "settings/SettingsStatus.h"
#include "support/ConditionListLoader.h"

RegistryStore* QENRegistryProfile::mStore = nullptr;

void QENRegistryProfile::SetStore(RegistryStore* store) {
  mStore = store;
}

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

int QENRegistryProfile::DeleteValue(void* root, const Dstring& key, const Dstring& name,
                                    ConditionList& list) {
  return GetStore().DeleteValue(root, key, name, list);
}

template <typename T>
int QENRegistryProfile::GetTyped(void* root, const Dstring& key, const Dstring& name, T& value,
                                 ConditionList& list) {
  Dstring data;
  if (int status = GetStore().Query(root, key, name, data, list)) return status;
  if constexpr (std::is_same_v<T, Dstring>) {
    value = data;  // a text value is the data itself
    return 0;
  } else {
    if (ProfileValue::Read(data, value) == ProfileValue::Outcome::kRead) return 0;
    ConditionListLoader::ConditionToken(list, "GUI_REGISTRY_PROFILE_UNEXPEXPECTED_VALUEDATA", {name, data},
                                        SettingsStatus::kUnexpectedValue);
    return SettingsStatus::kUnexpectedValue;
  }
}

int QENRegistryProfile::Put(void* root, const Dstring& key, const Dstring& name, const Dstring& text,
                            ConditionList& list) {
  return GetStore().Set(root, key, name, text, list);
}

template class TypedProfile<QENRegistryProfile, void*, const Dstring&>;
