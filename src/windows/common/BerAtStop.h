#pragma once

#include "core/uiapp.h"
#include "data/BerSvr.h"
#include "data/RunStopDs.h"

// The poll reads the error counts only while the instrument runs, so the counts of a run's
// last second would never be shown: a window that shows them reads once more when it is told
// that the run stopped.
inline int ReadBerAtStop(const QenDs* changed, ConditionList& list) {
  RunStopDs* run = uiapp::GetRunStopDs();
  BerSvr* svr = uiapp::GetBerSvr();
  if (changed == nullptr || changed != run || svr == nullptr || !svr->IsInitialized() || run->IsRunning()) return 0;
  return svr->UpdateFromFW(BerSvr::kReadResults, list);
}
