#include "settings/SettingStartUp.h"

#include "instrument/QenGuiInst.h"
#include "settings/QENSettingProfile.h"
#include "settings/SettingFile.h"
#include "settings/SettingMRU.h"
#include "settings/StartUpConfig.h"
#include "support/ConditionListLoader.h"
#include "support/LgsDebug.h"
#include "toolkit/ToolkitPort.h"

namespace {

int First(int a, int b) { return a != 0 ? a : b; }

}  // namespace

int SettingStartUp::Run(unsigned long paramSet, ToolkitPort& toolkit, SettingMRU& mru, ConditionList& list) {
  LgsDebug trace("SettingStartUp::Run ", "settings");
  StartUpConfig config;
  int status = config.Read(paramSet, list);
  status = First(status, mru.Read(paramSet, list));
  if (config.GetShowDialog() || toolkit.IsShiftDown()) {
    ConditionListLoader::ConditionToken(list, "GUI_STARTUP_NO_DIALOG");
  }
  const bool load = config.GetStart() == StartUpConfig::Start::kLoadSetting && config.Check(list) == 0;
  if (int started = load ? Load(config, list) : StartNew(list)) return First(status, started);
  if (load) status = First(status, Record(config, mru, list));
  return First(status, QENSettingProfile::Read(list));
}

int SettingStartUp::Load(const StartUpConfig& config, ConditionList& list) {
  return SettingFile::Load(config.GetSettingName(), config.GetCableDelay(), list);
}

int SettingStartUp::Record(const StartUpConfig& config, SettingMRU& mru, ConditionList& list) {
  return SettingFile::RecordOpen(config.GetSettingName(), config.GetCableDelay(), mru, list);
}

int SettingStartUp::StartNew(ConditionList& list) { return SettingFile::New(list); }
