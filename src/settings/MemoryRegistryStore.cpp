#include "settings/MemoryRegistryStore.h"

int MemoryRegistryStore::Done(const char* reason, const Dstring& key, const Dstring& name, ConditionList& list) {
  return reason == nullptr ? 0 : Fail(key, name, reason, list);
}

int MemoryRegistryStore::Query(void* root, const Dstring& key, const Dstring& name, Dstring& data,
                               ConditionList& list) {
  return Done(mTree.Query(root, key, name, data), key, name, list);
}

int MemoryRegistryStore::Set(void* root, const Dstring& key, const Dstring& name, const Dstring& data,
                             ConditionList& list) {
  return Done(mTree.Set(root, key, name, data), key, name, list);
}

int MemoryRegistryStore::HasValue(void* root, const Dstring& key, const Dstring& name, bool& exists,
                                  ConditionList& list) {
  return Done(mTree.HasValue(root, key, name, exists), key, name, list);
}

int MemoryRegistryStore::HasKey(void* root, const Dstring& key, bool& exists, ConditionList& list) {
  return Done(mTree.HasKey(root, key, exists), key, "", list);
}

int MemoryRegistryStore::DeleteValue(void* root, const Dstring& key, const Dstring& name, ConditionList& list) {
  return Done(mTree.DeleteValue(root, key, name), key, name, list);
}

int MemoryRegistryStore::DeleteKey(void* root, const Dstring& key, ConditionList& list) {
  return Done(mTree.DeleteKey(root, key), key, "", list);
}
