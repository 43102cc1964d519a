#include "support/QenEnvironment.h"

#include <cstdlib>
#include <filesystem>
#include <system_error>

namespace {

Dstring DefaultLogDirectory() {
  if (const char* state = std::getenv("XDG_STATE_HOME"); state && *state) return Dstring(state) + "/qengui";
  if (const char* home = std::getenv("HOME"); home && *home) return Dstring(home) + "/.local/state/qengui";
  return Dstring(".");
}

}  // namespace

std::optional<Dstring>& QenEnvironment::LogOverride() {
  static std::optional<Dstring> dir;
  return dir;
}

std::optional<unsigned long>& QenEnvironment::SetOverride() {
  static std::optional<unsigned long> set;
  return set;
}

Dstring QenEnvironment::GetLogDirectory() {
  Dstring dir;
  if (LogOverride()) {
    dir = *LogOverride();
  } else if (const char* env = std::getenv("QEN_LOG_DIR"); env && *env) {
    dir = env;
  } else {
    dir = DefaultLogDirectory();
  }
  std::error_code ignored;
  std::filesystem::create_directories(dir.c_str(), ignored);
  return dir;
}

unsigned long QenEnvironment::GetConfigParamSet() {
  if (SetOverride()) return *SetOverride();
  unsigned long set = 0;
  const char* env = std::getenv("QEN_CONFIG_PARAM_SET");
  if (env && Dstring(env).ToULong(set)) return set;
  return 0;
}
