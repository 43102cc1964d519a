#pragma once

#include <functional>
#include <ostream>

#include "support/ConditionList.h"
#include "support/Dstring.h"

// A file the user exports to: replaced whole, and "GUI_EXPORT_FAILED" naming the path and the
// system's reason when it cannot be written. When the writer fails or is stopped, the file goes.
class ExportFile {
 public:
  // Opens `path` for `write`, whose nonzero status is passed on as it is.
  static int Write(const Dstring& path, const std::function<int(std::ostream&)>& write, ConditionList& list);
  static int WriteText(const Dstring& path, const Dstring& text, ConditionList& list);
};
