#pragma once

#include "toolkit/ToolkitPort.h"

// The toolkit in use: the headless adapter until a host installs another.
class Toolkit {
 public:
  static ToolkitPort& Get();
  // Not owned; null goes back to the headless adapter.
  static void Install(ToolkitPort* port);
};
