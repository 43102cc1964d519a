#pragma once

#include "support/Dstring.h"

// A window of the library, known by its resource name ("paramedit.ParamEd").
struct WindowResource {
  Dstring resource;
  // What the Windows menu and the window's frame call it.
  Dstring title;
  // Bound to its class by uiapp::RegisterWindows.
  bool bound = false;
  // On the Windows menu; the others open from another window or a command.
  bool onMenu = false;
  // Reads the instrument to open, so it cannot open while another client holds it.
  bool needsInstrument = false;
};
