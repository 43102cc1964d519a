#pragma once

#include "settings/TypedProfile.h"
#include "support/ConditionList.h"
#include "support/DataParcel.h"
#include "support/Dstring.h"
#include "support/LispList.h"

class RegistryStore;

// Named values in the registry, below a root key (RegistryStore::CurrentUser()) and a key
// path that the caller names. Every value is kept as text in the forms of ProfileValue
// without parentheses: "12i", "7u", "1.5f", "2.5e-09d", the text itself, or a list
// expression "(1,2)".
class QENRegistryProfile : public TypedProfile<QENRegistryProfile, void*, const Dstring&> {
 public:
  // The interface's own key, and the key it had under the maker's former name.
  static constexpr const char* kGuiKey = "SOFTWARE\\Corvane\\Corvane 71300\\Gui";
  static constexpr const char* kFormerGuiKey = "SOFTWARE\\Tandry\\TM71300\\Gui";

  // Not owned; null goes back to the store of this platform (FileRegistryStore at its
  // default path, made on first use).
  static void SetStore(RegistryStore* store);
  static RegistryStore& GetStore();

  static int Exists(void* root, const Dstring& key, const Dstring& name, int& exists, ConditionList& list);
  static int KeyExists(void* root, const Dstring& key, int& exists, ConditionList& list);
  static int DeleteKey(void* root, const Dstring& key, ConditionList& list);
  static int DeleteValue(void* root, const Dstring& key, const Dstring& name, ConditionList& list);

 private:
  friend class TypedProfile<QENRegistryProfile, void*, const Dstring&>;
  static constexpr bool kParens = false;
  template <typename T>
  static int GetTyped(void* root, const Dstring& key, const Dstring& name, T& value, ConditionList& list);
  static int Put(void* root, const Dstring& key, const Dstring& name, const Dstring& text,
                 ConditionList& list);
  // A text value is the data itself.
  static Dstring TextValue(const Dstring& text) { return text; }

  static RegistryStore* mStore;
};

extern template class TypedProfile<QENRegistryProfile, void*, const Dstring&>;
