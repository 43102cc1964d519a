#pragma once

#include <cstddef>

#include "support/ConditionList.h"
#include "support/DstringList.h"

// The settings used most recently with a configuration parameter set: most recent first, each
// name once, at most kLength names. Kept in the registry below the current user's
// "...\Gui\ParameterSetMRU<n>" as the one list value "Settings" ("("A","B")"), so that a list
// is always replaced whole; when it is missing, the one below the maker's former name is
// read. Names compare exactly, as the instrument's setting files do.
class SettingMRU {
 public:
  static constexpr std::size_t kLength = 8;

  static Dstring KeyOf(unsigned long paramSet);
  static Dstring FormerKeyOf(unsigned long paramSet);

  // Takes the list of `paramSet`; a missing list is empty. Names that are not texts are
  // refused with the whole value.
  int Read(unsigned long paramSet, ConditionList& list);
  int Write(ConditionList& list) const;
  // Puts `name` first; an empty name is ignored.
  void Add(const Dstring& name);
  // Add and Write: what a load or a save of a setting calls.
  int Record(const Dstring& name, ConditionList& list);

  const DstringList& GetNames() const { return mNames; }

 private:
  unsigned long mParamSet = 0;
  DstringList mNames;
};
