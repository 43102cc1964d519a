#include "settings/RegistryStore.h"

#include <cstdint>

#include "settings/SettingsStatus.h"
#include "support/ConditionListLoader.h"

// The values of HKEY_CURRENT_USER and HKEY_LOCAL_MACHINE, so that a root can be handed to the
// registry calls unchanged.
void* RegistryStore::CurrentUser() { return reinterpret_cast<void*>(std::uintptr_t{0x80000001}); }

void* RegistryStore::LocalMachine() { return reinterpret_cast<void*>(std::uintptr_t{0x80000002}); }

int RegistryStore::Fail(const Dstring& key, const Dstring& name, const Dstring& reason, ConditionList& list) {
  ConditionListLoader::ConditionToken(list, "GUI_REGISTRY_PROFILE_REGISTRY_ERROR", {key, name, reason},
                                      SettingsStatus::kRegistryError);
  return SettingsStatus::kRegistryError;
}
