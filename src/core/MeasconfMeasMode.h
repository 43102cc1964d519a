#pragma once

#include "support/ConditionList.h"

// The measurement mode tool as the application core sees it. The dialog ("measconf.MeasMode")
// edits the measurement parameters through bound controls; a start must not leave behind what
// the user typed into it but has not yet committed, so uiapp::Run asks UpdateBeforeRun first,
// and the open dialog sends its pending edit then.
class MeasconfMeasMode {
 public:
  // The open dialog, as the core reaches it.
  class Editor {
   public:
    virtual ~Editor() = default;
    // Writes the edit in progress, if any; its status, with the write's conditions.
    virtual int CommitPendingEdit(ConditionList& list) = 0;
  };

  // The dialog registers while it is open and withdraws as it goes.
  static void SetEditor(Editor* editor) { sEditor = editor; }
  static Editor* GetEditor() { return sEditor; }
  // Nothing to do without an open dialog.
  static int UpdateBeforeRun(ConditionList& list) { return sEditor != nullptr ? sEditor->CommitPendingEdit(list) : 0; }

 private:
  static inline Editor* sEditor = nullptr;
};
