#pragma once

#include "support/ConditionList.h"
#include "support/Dstring.h"

// Where the registry profile keeps its values: a tree of keys below a root key, each key with
// named text values. Key paths are written with backslashes ("SOFTWARE\Corvane\Gui") and,
// like value names, compare without regard to case. Setting a value creates its key and the
// keys above it. Every failure adds "GUI_REGISTRY_PROFILE_REGISTRY_ERROR" naming the key, the
// value and the reason, returns nonzero and leaves the store as it was.
class RegistryStore {
 public:
  virtual ~RegistryStore() = default;

  // The two root keys; on Windows they are the registry's own handles.
  static void* CurrentUser();
  static void* LocalMachine();

  virtual int Query(void* root, const Dstring& key, const Dstring& name, Dstring& data, ConditionList& list) = 0;
  virtual int Set(void* root, const Dstring& key, const Dstring& name, const Dstring& data, ConditionList& list) = 0;
  virtual int HasValue(void* root, const Dstring& key, const Dstring& name, bool& exists, ConditionList& list) = 0;
  virtual int HasKey(void* root, const Dstring& key, bool& exists, ConditionList& list) = 0;
  virtual int DeleteValue(void* root, const Dstring& key, const Dstring& name, ConditionList& list) = 0;
  // A key that still has keys below it is not deleted.
  virtual int DeleteKey(void* root, const Dstring& key, ConditionList& list) = 0;

 protected:
  static int Fail(const Dstring& key, const Dstring& name, const Dstring& reason, ConditionList& list);
};
