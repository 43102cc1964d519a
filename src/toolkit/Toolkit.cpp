#include "toolkit/Toolkit.h"

#include "toolkit/HeadlessToolkit.h"

namespace {

ToolkitPort* gInstalled = nullptr;

}  // namespace

ToolkitPort& Toolkit::Get() {
  static HeadlessToolkit headless;
  return gInstalled ? *gInstalled : headless;
}

void Toolkit::Install(ToolkitPort* port) { gInstalled = port; }
