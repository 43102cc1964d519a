#include "settings/SettingStartUp.h"

#include "instrument/QenGuiInst.h"
#include "settings/QENSettingProfile.h"
#include "settings/QENSystemProfile.h"
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
  const Dstring& name = config.GetSettingName();
  const Dstring cmd = Dstring::Format(":%s:MMEM:SETT:LOAD \"%s\", %s", QenGuiInst::GetAppHandle().c_str(),
                                      name.c_str(), config.GetCableDelay() ? "ON" : "OFF");
  Dstring reply;
  return QenGuiInst::Call(cmd, reply, list);
}

int SettingStartUp::Record(const StartUpConfig& config, SettingMRU& mru, ConditionList& list) {
  const Dstring& name = config.GetSettingName();
  int status = QENSystemProfile::SetValue("OPENSETTING_NAME", name, list);
  status = First(status, QENSystemProfile::SetValue("OPENSETTING_CABLEDELAY", config.GetCableDelay() ? 1UL : 0UL, list));
  return First(status, mru.Record(name, list));
}

int SettingStartUp::StartNew(ConditionList& list) {
  Dstring reply;
  return QenGuiInst::Call(Dstring::Format(":%s:MMEM:SETT:NEW", QenGuiInst::GetAppHandle().c_str()), reply, list);
}
