#pragma once

#include "support/ConditionList.h"
#include "support/DstringList.h"

// The instrument's setting commands: a new setting, loading and saving one by name, and the
// names the server keeps. Each is one command and records nothing; OpenSettingDs makes the
// File menu's operations of them. Names are user text: one that would break the command is
// refused before anything is sent.
class SettingFile {
 public:
  static int New(ConditionList& list);
  static int Load(const Dstring& name, bool cableDelay, ConditionList& list);
  static int Save(const Dstring& name, ConditionList& list);
  // The names of the settings the server keeps (":MMEM:SETT:CAT?").
  static int Catalogue(DstringList& names, ConditionList& list);
};
