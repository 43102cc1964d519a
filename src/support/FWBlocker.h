#pragma once

#include <string_view>

#include "support/ConditionList.h"

// The guard opened at the start of every user-initiated or re-entrant operation, named after
// it ("uiapp::Run"). When Block() returns nonzero the operation does nothing and returns that
// value. The rules:
//  1. While the instrument is held by another client, Block() returns -19 (kLocked) and adds
//     no condition: a lock is a state, not an error. The lock state comes from the probe that
//     the instrument layer installs; without a probe the instrument counts as free.
//  2. An operation that is already running further up the call stack under the same name is
//     not run again: Block() returns kBusy and adds "GUI_OPERATION_BUSY". Re-entering a
//     half-done edit, poll or refresh would work on state the outer call is still changing.
//  3. Except for the names that nest by design: "QenDs::Update" (a notification may update
//     other sources, each its own pass) and "Dte::Write" (a view may write while being told of
//     a write; the engine takes its batch before sending).
//  4. While a long command waits for the server and lets events run (a WaitScope is open),
//     every operation an event or timer starts is not run: kBusy, "GUI_INSTRUMENT_BUSY".
//  5. Block() asks once; later calls on the same guard give the same answer. Rule 1 is checked
//     before rules 2 and 4. Guards are for the GUI thread only.
class FWBlocker {
 public:
  static constexpr int kLocked = -19;
  static constexpr int kBusy = -21;

  // Tells whether another client holds the instrument.
  class LockProbe {
   public:
    virtual ~LockProbe() = default;
    virtual bool IsInstrumentLocked() = 0;
  };

  FWBlocker(std::string_view name, ConditionList& list);
  ~FWBlocker();
  FWBlocker(const FWBlocker&) = delete;
  FWBlocker& operator=(const FWBlocker&) = delete;

  int Block();
  std::string_view GetName() const { return mName; }

  // The probe of rule 1; null removes it. Not owned.
  static void SetLockProbe(LockProbe* probe);

  // Rule 4, for the time events run while a command waits.
  class WaitScope {
   public:
    WaitScope();
    ~WaitScope();
    WaitScope(const WaitScope&) = delete;
    WaitScope& operator=(const WaitScope&) = delete;
  };

 private:
  std::string_view mName;
  ConditionList& mList;
  const FWBlocker* mOuter;
  bool mAsked = false;
  int mResult = 0;
};
