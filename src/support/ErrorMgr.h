#pragma once

#include "support/ConditionList.h"

// The application's accumulated conditions. Owned by the application core; handed to the
// services below it, which clear it after a successful exchange.
class ErrorMgr {
 public:
  virtual ~ErrorMgr() = default;

  void add(const ConditionList& list) { mList.Append(list); }
  void clear() { mList.Clear(); }
  ConditionList* list() { return &mList; }

 private:
  ConditionList mList;
};
