#pragma once

#include <vector>

#include "data/QenDs.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

// The names of the saved segments as the server lists them (":EDIT:SEGM:CAT?"), which every
// list of segments follows. The pool reads it again when the poll reports a change of the
// catalogue (another client saved or deleted a segment) or of everything, and after this
// side's own saves, creates and deletes, as long as a view follows it; the views are told only
// when the names changed.
class SegmentCatalogDs : public QenDs {
 public:
  const std::vector<Dstring>& GetNames() const { return mNames; }
  // Whether the names have been read once.
  bool IsRead() const { return mRead; }
  bool Contains(const Dstring& name) const;
  // Reads the names; a reply that cannot be read keeps the names known before.
  int Read(ConditionList& list);

 private:
  std::vector<Dstring> mNames;
  bool mRead = false;
};
