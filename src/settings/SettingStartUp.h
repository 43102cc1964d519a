#pragma once

#include "support/ConditionList.h"
#include "support/DstringList.h"

class OpenSettingDs;
class SettingMRU;
class StartUpConfig;
class ToolkitPort;

// The first setting of a session, steps 1 to 3 of the start-up:
//  1. the start-up configuration and the recently used list of the parameter set are read;
//  2. when the configuration asks for the start-up dialog, or Shift is held, the dialog shows
//     it, and again while the choice does not check out; the choice becomes the configuration.
//     Without a dialog (or one asked for), a configuration that does not check out keeps what
//     the instrument holds;
//  3. the chosen start is made: keep what the instrument holds (nothing is sent), a new
//     setting, or a load with its cable-delay choice; then the setting's profile is read.
// Every condition is shown where it arises (through QenGuiInst::ShowErrorDlg); a start that
// fails leaves the instrument as it was.
class SettingStartUp {
 public:
  // The start-up dialog; the window layer registers one.
  class Dialog {
   public:
    virtual ~Dialog() = default;
    // Shows `config` and changes it to the user's choice. `names` are the settings the
    // instrument keeps, `problems` why the last choice did not check out (empty at first).
    // False when the user cancels.
    virtual bool Ask(StartUpConfig& config, const DstringList& names, const ConditionList& problems) = 0;
  };
  static void SetDialog(Dialog* dialog) { sDialog = dialog; }

  // 0 when the start goes on, SettingsStatus::kStartCancelled when the user cancelled the dialog.
  static int Run(unsigned long paramSet, ToolkitPort& toolkit, SettingMRU& mru, OpenSettingDs& setting);
  // 0 when the start can be made: a load needs a name that can be sent and, when `names` is
  // given, is one of them.
  static int Check(const StartUpConfig& config, const DstringList* names, ConditionList& list);

 private:
  static int Choose(unsigned long paramSet, StartUpConfig& config);
  static int Start(const StartUpConfig& config, SettingMRU& mru, OpenSettingDs& setting, ConditionList& list);

  static inline Dialog* sDialog = nullptr;
};
