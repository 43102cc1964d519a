#pragma once

#include <functional>
#include <ostream>

#include "support/ConditionList.h"
#include "support/Dstring.h"

// A file the user exports to: replaced whole, or left as it was. The text goes to a new file
// beside it, which is flushed to the disk and then renamed over it, so that a writer that fails
// or is stopped, a full disk or a crash never leaves a file half-written or the old one lost.
// "GUI_EXPORT_FAILED" names the path and the system's reason when it cannot be written.
class ExportFile {
 public:
  // Writes `path` through `write`, whose nonzero status is passed on as it is.
  static int Write(const Dstring& path, const std::function<int(std::ostream&)>& write, ConditionList& list);
  static int WriteText(const Dstring& path, const Dstring& text, ConditionList& list);
};
