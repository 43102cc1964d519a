#pragma once

#include <set>

#include "data/QenDs.h"
#include "support/Dstring.h"

// The change detector: asks the server which settings changed since the last poll
// ("<handle>:DFL?") and tells the registrations that match a changed name. The reply is empty
// (nothing changed), "\"ALL\"" (everything), or quoted names.
class DirtyFlagDs : public QenDs {
 public:
  int UpdateFromFW(ConditionList& list);
  // Clears the dirty flag, tells every registration (the guard permitting), then clears the
  // in-firmware-update flag.
  virtual int Update(ConditionList& list);
  using QenDs::Update;

  void ForceUpdate();
  unsigned IsDirty() const { return mDirty; }
  unsigned IsInFWUpdate() const { return mInFWUpdate; }

  // What the pass under way reports: everything, or these names as the server wrote them.
  bool IsAllChanged() const { return mAllChanged; }
  const std::set<Dstring>& GetChangedNames() const { return mChanged; }

 private:
  int NotifyMatching(ConditionList& list);

  unsigned mDirty = 0;
  unsigned mInFWUpdate = 0;
  bool mAllChanged = false;
  std::set<Dstring> mChanged;
};
