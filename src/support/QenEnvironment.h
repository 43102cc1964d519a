#pragma once

#include <optional>

#include "support/Dstring.h"

// The process environment of the library: where the log goes and which configuration
// parameter set is in use. Command-line options override the variables QEN_LOG_DIR and
// QEN_CONFIG_PARAM_SET, which override the defaults.
class QenEnvironment {
 public:
  // The log directory, created if missing: QEN_LOG_DIR, else $XDG_STATE_HOME/qengui,
  // else ~/.local/state/qengui, else the current directory.
  static Dstring GetLogDirectory();
  // The configuration parameter set: QEN_CONFIG_PARAM_SET read as an unsigned decimal
  // number; 0 when unset or not a number.
  static unsigned long GetConfigParamSet();

  static void SetLogDirectory(std::optional<Dstring> dir) { LogOverride() = std::move(dir); }
  static void SetConfigParamSet(std::optional<unsigned long> set) { SetOverride() = set; }

 private:
  static std::optional<Dstring>& LogOverride();
  static std::optional<unsigned long>& SetOverride();
};
