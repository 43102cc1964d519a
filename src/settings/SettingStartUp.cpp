#include "settings/SettingStartUp.h"

#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "settings/OpenSettingDs.h"
#include "settings/QENSettingProfile.h"
#include "settings/SettingFile.h"
#include "settings/SettingMRU.h"
#include "settings/SettingsStatus.h"
#include "settings/StartUpConfig.h"
#include "support/ConditionListLoader.h"
#include "support/LgsDebug.h"
#include "toolkit/ToolkitPort.h"

namespace {

void Show(ConditionList& list) {
  QenGuiInst::ShowErrorDlg(list, 1);
  list.Clear();
}

}  // namespace

int SettingStartUp::Run(unsigned long paramSet, ToolkitPort& toolkit, SettingMRU& mru, OpenSettingDs& setting) {
  LgsDebug trace("SettingStartUp::Run ", "settings");
  ConditionList list;
  StartUpConfig config;
  config.Read(paramSet, list);
  mru.Read(paramSet, list);
  Show(list);
  if (config.GetShowDialog() || toolkit.IsShiftDown()) {
    if (sDialog != nullptr) {
      if (Choose(paramSet, config) != 0) return SettingsStatus::kStartCancelled;
    } else {
      ConditionListLoader::ConditionToken(list, "GUI_STARTUP_NO_DIALOG");
      Show(list);
    }
  }
  if (Check(config, nullptr, list) != 0) {
    ConditionListLoader::ConditionToken(list, "GUI_STARTUP_KEPT");
    config.SetStart(StartUpConfig::Start::kKeepSetting);
    Show(list);
  }
  if (Start(config, mru, setting, list) != 0 && config.GetStart() != StartUpConfig::Start::kKeepSetting) {
    // What the instrument holds now, whatever the start made of it.
    ConditionList ignored;
    setting.Read(ignored);
  }
  Show(list);
  if (QENSettingProfile::Read(list) == QenStatus::kLocked) list.Clear();
  Show(list);
  return 0;
}

int SettingStartUp::Choose(unsigned long paramSet, StartUpConfig& config) {
  DstringList names;
  ConditionList problems;
  const bool known = SettingFile::Catalogue(names, problems) == 0;
  if (!known && problems.IsEmpty()) ConditionListLoader::ConditionToken(problems, "GUI_SETTING_LOCKED");
  do {
    if (!sDialog->Ask(config, names, problems)) return SettingsStatus::kStartCancelled;
    problems.Clear();
  } while (Check(config, known ? &names : nullptr, problems) != 0);
  ConditionList list;
  config.Write(paramSet, list);
  Show(list);
  return 0;
}

int SettingStartUp::Check(const StartUpConfig& config, const DstringList* names, ConditionList& list) {
  if (int status = config.Check(list)) return status;
  if (config.GetStart() != StartUpConfig::Start::kLoadSetting || names == nullptr) return 0;
  if (names->Contains(config.GetSettingName())) return 0;
  ConditionListLoader::ConditionToken(list, "GUI_STARTUP_NO_SUCH_SETTING", {config.GetSettingName()},
                                      SettingsStatus::kBadStartUp);
  return SettingsStatus::kBadStartUp;
}

int SettingStartUp::Start(const StartUpConfig& config, SettingMRU& mru, OpenSettingDs& setting, ConditionList& list) {
  switch (config.GetStart()) {
    case StartUpConfig::Start::kLoadSetting:
      return setting.Load(config.GetSettingName(), config.GetCableDelay(), mru, list);
    case StartUpConfig::Start::kNewSetting:
      return setting.New(list);
    case StartUpConfig::Start::kKeepSetting:
      break;
  }
  return setting.Read(list);
}
