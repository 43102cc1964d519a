#pragma once

#include "toolkit/Toolkit.h"

// Shows the wait cursor for the life of the scope.
class WaitCursor {
 public:
  WaitCursor() { Toolkit::Get().SetWaitCursor(true); }
  ~WaitCursor() { Toolkit::Get().SetWaitCursor(false); }
  WaitCursor(const WaitCursor&) = delete;
  WaitCursor& operator=(const WaitCursor&) = delete;
};
