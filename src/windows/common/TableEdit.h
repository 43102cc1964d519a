#pragma once

#include <functional>

#include "core/uiapp.h"
#include "data/GuiLockDs.h"
#include "params/ui/BoundControl.h"
#include "support/ConditionList.h"

// How a table model's typed cell reaches the instrument: the window runs the edit (under its
// undo, say) and shows a refusal; the status says whether the edit was taken.
using TableEditRunner = std::function<int(const std::function<int(ConditionList&)>& edit)>;

// The runner of a model no window runs: the edit alone, a refusal shown in the error dialog.
inline int ReportedEdit(const std::function<int(ConditionList&)>& edit) {
  ConditionList list;
  const int status = edit(list);
  BoundControl::Report(list);
  return status;
}

// Whether another client holds the instrument, as the poll last found it.
inline bool InstrumentHeld() { return uiapp::GetGuiLockDs() != nullptr && uiapp::GetGuiLockDs()->IsLocked(); }
