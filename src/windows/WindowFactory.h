#pragma once

#include <functional>
#include <vector>

#include "support/ConditionList.h"
#include "support/Dstring.h"

class QWidget;

// The windows that are built, by their resource name ("paramedit.ParamEd"), with the title the
// Windows menu shows. A window that cannot be built returns null with a condition.
class WindowFactory {
 public:
  using Make = std::function<QWidget*(QWidget* parent, ConditionList& list)>;
  struct Entry {
    Dstring resource;
    Dstring title;
    Make make;
    // The window reads the instrument to open, so it cannot open while another client holds it.
    bool needsInstrument = false;
  };

  // The built windows, in menu order.
  static const std::vector<Entry>& Entries();
  static const Entry* Find(const Dstring& resource);
};
