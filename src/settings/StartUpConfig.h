#pragma once

#include "support/ConditionList.h"
#include "support/Dstring.h"

// How the interface starts for a configuration parameter set: with the start-up dialog or
// not; keeping the setting the instrument holds, with a new setting, or by loading a named
// one, and whether that load takes the cable delays stored in the setting. Kept in the
// registry below the current user's "...\Gui\StartUpParameterSet<n>" as the values
// ShowDialog (0u/1u), Start (KEEP, NEW or LOAD), SettingName (text) and CableDelay (0u/1u). A
// value that is missing keeps its default; when the key is missing altogether, the same key
// below the maker's former name is read. By default a start keeps what the instrument holds:
// connecting changes nothing unless the user asked for it.
class StartUpConfig {
 public:
  enum class Start { kKeepSetting, kNewSetting, kLoadSetting };
  static constexpr const char* kDefaultSettingName = "UNTITLED";

  static Dstring KeyOf(unsigned long paramSet);
  static Dstring FormerKeyOf(unsigned long paramSet);

  // Every value that cannot be read is reported and keeps its default; the first failure is
  // returned once all were tried.
  int Read(unsigned long paramSet, ConditionList& list);
  int Write(unsigned long paramSet, ConditionList& list) const;
  // Whether the configured start can be made: a load needs a name that can be sent.
  int Check(ConditionList& list) const;

  bool GetShowDialog() const { return mShowDialog; }
  void SetShowDialog(bool on) { mShowDialog = on; }
  Start GetStart() const { return mStart; }
  void SetStart(Start start) { mStart = start; }
  const Dstring& GetSettingName() const { return mSettingName; }
  void SetSettingName(const Dstring& name) { mSettingName = name; }
  bool GetCableDelay() const { return mCableDelay; }
  void SetCableDelay(bool on) { mCableDelay = on; }

 private:
  int ReadFrom(const Dstring& key, ConditionList& list);

  bool mShowDialog = false;
  Start mStart = Start::kKeepSetting;
  Dstring mSettingName = kDefaultSettingName;
  bool mCableDelay = false;
};
