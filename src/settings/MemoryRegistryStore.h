#pragma once

#include "settings/RegistryStore.h"
#include "settings/RegistryTree.h"

// The registry kept in memory only: for tests, and for hosts that must leave no trace.
class MemoryRegistryStore : public RegistryStore {
 public:
  int Query(void* root, const Dstring& key, const Dstring& name, Dstring& data, ConditionList& list) override;
  int Set(void* root, const Dstring& key, const Dstring& name, const Dstring& data, ConditionList& list) override;
  int HasValue(void* root, const Dstring& key, const Dstring& name, bool& exists, ConditionList& list) override;
  int HasKey(void* root, const Dstring& key, bool& exists, ConditionList& list) override;
  int DeleteValue(void* root, const Dstring& key, const Dstring& name, ConditionList& list) override;
  int DeleteKey(void* root, const Dstring& key, ConditionList& list) override;

 private:
  int Done(const char* reason, const Dstring& key, const Dstring& name, ConditionList& list);

  RegistryTree mTree;
};
