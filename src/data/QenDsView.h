#pragma once

#include "support/ConditionList.h"
#include "support/Dstring.h"

class QenDs;

// The observer of a data source. A view must unregister from every source before it dies.
class QenDsView {
 public:
  virtual ~QenDsView() = default;

  virtual int NfyViewRegistered(QenDs*, ConditionList&) { return 0; }
  virtual int NfyViewUnregistered(QenDs*, ConditionList&) { return 0; }
  virtual int NfyViewDataUpdated(QenDs* source, ConditionList& list) = 0;
  // Whether a changed server setting of this name concerns the view (dirty-flag views).
  virtual int Match(const Dstring&) { return 0; }
};
