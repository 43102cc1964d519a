#pragma once

#include "support/ConditionList.h"
#include "support/DstringList.h"

class SettingMRU;

// The settings on the server as the File menu works them: a new setting, loading and saving
// one by name (recording it as the open setting and first in the recently used list), and the
// names the server keeps. Names are user text: one that would break the command is refused
// before anything is sent.
class SettingFile {
 public:
  static int New(ConditionList& list);
  static int Load(const Dstring& name, bool cableDelay, ConditionList& list);
  // Load, then record it as the open setting and in `mru`.
  static int Open(const Dstring& name, bool cableDelay, SettingMRU& mru, ConditionList& list);
  static int Save(const Dstring& name, SettingMRU& mru, ConditionList& list);
  // The names of the settings the server keeps (":MMEM:SETT:CAT?").
  static int Catalogue(DstringList& names, ConditionList& list);
  // The open setting ("OPENSETTING_NAME" of the system profile), empty when none was opened.
  static Dstring CurrentName();
  static int RecordOpen(const Dstring& name, bool cableDelay, SettingMRU& mru, ConditionList& list);
};
