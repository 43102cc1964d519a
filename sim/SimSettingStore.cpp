#include "SimSettingStore.h"

bool SimSettingStore::RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) {
  if (rest != ":MMEM:SETT:NEW") return false;
  if (cmd.IsQuery() || cmd.HasArgs()) {
    context.Error(-113);
    return true;
  }
  context.Params() = mDefaults;
  context.MarkAllDirty();
  return true;
}
