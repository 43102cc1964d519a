#pragma once

#include "data/QenDs.h"
#include "data/QenDsView.h"
#include "support/Dstring.h"

// The data source of one named instrument parameter: caches its value text and builds its
// read ("<header>?") and write ("<header> <value>") commands. Made and destroyed only by Dte.
//
// Flags, and where they change:
// - valid: set by a successful read; cleared when the engine refreshes the source (a coupled
//   change, a dirty-flag report, Dte::Update, Dte::ResetEngine) and by a failed read or write.
// - failed: set by a failed read or write of this source, cleared by a successful one. A lock
//   (-19) is a state of the instrument, not a failure of the source.
// - clashing: the parameter clashes with another setting ("<header>? CLAS" answers 1). Every
//   read of the value asks it in the same round trip, so IsClashing asks nothing. A server
//   that refuses the clash form is asked the value alone ("<header>?"), the clash unknown.
// - in transaction: set by a write inside a transaction, cleared when the batch is sent.
// - sub-command: the value is a quoted sub-command word and value, as in "\"PRBS 7\"".
class QenParamDs : public QenDs, public QenDsView {
 public:
  int QueryStrValue(Dstring& out, ConditionList& list);
  int SetStrValue(const Dstring& value, ConditionList& list);
  int QuerySubCmd(Dstring& out, ConditionList& list);
  int SetSubCmd(const Dstring& sub, ConditionList& list, const Dstring& value = {});
  // The limits are asked each time ("<header>? HLIM"), never cached.
  int QueryHLimStrValue(Dstring& out, ConditionList& list);
  int QueryLLimStrValue(Dstring& out, ConditionList& list);
  int QueryHMaxStrValue(Dstring& out, ConditionList& list);
  int QueryLMaxStrValue(Dstring& out, ConditionList& list);

  // Whether the parameter clashed when its value was last read; asks nothing.
  unsigned IsClashing() const { return mValid && mClashing; }
  unsigned IsFailed() const { return mFailed; }
  unsigned IsUsed() const { return mUsed; }
  unsigned IsReadOnly() const { return mReadOnly; }
  void SetReadOnly(unsigned readOnly) { mReadOnly = readOnly; }

  // A name designates this source when it equals the program header, ignoring case.
  int Match(const Dstring& name) override;
  // A source it watches changed: forget the cached value and tell this source's views.
  int NfyViewDataUpdated(QenDs* source, ConditionList& list) override;

  const Dstring& GetProgramHeader() const { return mProgramHeader; }

 protected:
  void SetProgramHeader(const Dstring& header) { mProgramHeader = header; }
  Dstring GetReadCmdStr() const { return mProgramHeader + "?"; }
  // The value and the clash state in one joined query.
  Dstring GetReadWithClashCmdStr() const { return GetReadCmdStr() + ";" + mProgramHeader + "? CLAS"; }
  // What a read sends: the joined query, or the value alone once the server refused the clash
  // form for this parameter.
  Dstring GetRefreshCmdStr() const { return mClashUnknown ? GetReadCmdStr() : GetReadWithClashCmdStr(); }
  // The reply parts of GetRefreshCmdStr.
  std::size_t GetRefreshParts() const { return mClashUnknown ? 1 : 2; }
  Dstring GetWriteCmdStr() const { return mProgramHeader + " " + mValue; }
  unsigned GetFailed() const { return mFailed; }
  void SetFailed(unsigned failed) { mFailed = failed; }
  unsigned GetReleasePending() const { return mReleasePending; }
  void SetReleasePending(unsigned pending) { mReleasePending = pending; }
  unsigned IsInTransaction() const { return mInTransaction; }
  void SetInTransaction(unsigned in) { mInTransaction = in; }
  unsigned IsSubCmdEnabled() const { return mSubCmdEnabled; }
  void SetSubCmdEnabled(unsigned enabled) { mSubCmdEnabled = enabled; }

 private:
  friend class Dte;
  friend class DteRefresher;

  explicit QenParamDs(const Dstring& header);
  ~QenParamDs() override;

  int QueryLimit(const char* which, Dstring& out, ConditionList& list);
  // The current sub-command word of the cached text, or empty.
  Dstring CurrentSubCmd() const;
  void TakeReadValue(const Dstring& value, bool clashing);
  // Takes the reply of GetReadWithClashCmdStr; false when it is not two parts.
  bool TakeReadReply(const Dstring& reply);
  int ReadValue(ConditionList& list);
  void Invalidate() { mValid = false; }

  Dstring mProgramHeader;
  Dstring mValue;
  bool mValid = false;
  bool mClashing = false;
  bool mClashUnknown = false;
  unsigned mFailed = 0;
  unsigned mReleasePending = 0;
  unsigned mInTransaction = 0;
  unsigned mSubCmdEnabled = 0;
  unsigned mUsed = 0;
  unsigned mReadOnly = 0;
};
