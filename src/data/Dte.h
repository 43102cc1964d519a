#pragma once

#include <set>
#include <vector>

#include "data/DsNfyListEntry.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

class DirtyFlagDs;
class ErrorMgr;
class QenDsView;
class QenParamDs;

// The engine through which every window reads and writes instrument parameters. One
// QenParamDs per parameter in a shared repository; writes are batched into one ";"-joined
// command, and after each write the server is asked which parameters changed with it ("VC")
// and whose limits changed ("RC"), and their sources are refreshed and their views told.
//
// Choices of this engine:
// - Names are program headers and compare without regard to case, as the server's do. The
//   repository keeps its order (the most recently written source first) and has an index,
//   so finding a source costs the same with ten or ten thousand of them.
// - The unsigned of AllocDsByName holds flags (kSubCmd: the value is a sub-command word and
//   value). The unsigned of RegisterView and RegisterProc is "tell at once": when nonzero the
//   new registration is notified right away, so a control shows the value it bound to.
// - The named RegisterView/RegisterProc allocate the source and hold that reference; the
//   named Unregister forms free it.
// - A write inside a transaction adds its command to the pending batch at once, so the batch
//   keeps the order in which the user acted, and marks its source "in transaction"; the marked
//   sources are the members of the transaction, marked failed together when the batch fails.
//   The first header of the batch names the batch in the trace.
// - The run bracket ("CONT OFF" before, "CONT ON" after) is used when clashing sources were
//   added and the run state reads "ON".
// - A refresh of many sources (a coupled change, a dirty-flag report, Update, ResetEngine)
//   first reads their values in ";"-joined queries of at most kRefreshBatchBytes, so every
//   view then finds a valid cache. If such a query fails, its sources stay unread and each
//   view's own query reports the error.
class Dte {
 public:
  static constexpr unsigned kSubCmd = 1;
  // A quarter of the 16 MiB frame: the joined replies, longer than the queries, fit as well.
  static constexpr std::size_t kRefreshBatchBytes = 4u << 20;

  // The dirty-flag source (may be null) is followed so that sources refresh when the server
  // reports their parameters changed; the error manager (may be null) is cleared after each
  // successful write.
  static void Init(DirtyFlagDs* dirtyFlag = nullptr, ErrorMgr* errorMgr = nullptr);
  static void End();

  static QenParamDs* GetDsByName(const Dstring& name);
  static QenParamDs* AllocDsByName(const Dstring& name, unsigned flags);
  static void FreeDs(QenParamDs* source);

  static int RegisterView(const Dstring& name, QenDsView* view, ConditionList& list, unsigned tell);
  static int RegisterView(QenParamDs* source, QenDsView* view, ConditionList& list, unsigned tell);
  static int UnregisterView(const Dstring& name, QenDsView* view, ConditionList& list);
  static int UnregisterView(QenParamDs* source, QenDsView* view, ConditionList& list);
  static int RegisterProc(const Dstring& name, QenDsProc proc, void* client, unsigned tell);
  static int RegisterProc(QenParamDs* source, QenDsProc proc, void* client, unsigned tell);
  static int UnregisterProc(const Dstring& name, QenDsProc proc, void* client);
  static int UnregisterProc(QenParamDs* source, QenDsProc proc, void* client);

  static void StartTransaction() { mInTransaction = 1; }
  static int EndTransaction(ConditionList& list);
  static unsigned IsInTransaction() { return mInTransaction; }
  static int SendCmd(const Dstring& cmd, ConditionList& list);
  static int Write(QenParamDs* source, ConditionList& list);

  static int Update(ConditionList& list);
  static int UpdateDsByName(const Dstring& name, ConditionList& list);
  static int ResetEngine(ConditionList& list);
  static unsigned IsFailed();
  static void ReleaseAllFailed();
  static std::size_t NumSources();
  // Reads the sources that hold no valid value in joined queries, telling no view: a window
  // about to bind many controls calls it first, so that each finds its value cached.
  static void Prefetch(const std::vector<QenParamDs*>& sources);

 private:
  friend class QenParamDs;

  // Called by a source that is being destroyed.
  static void Forget(QenParamDs* source);
  static int QueryValueCoupled(const Dstring& cmds, std::set<Dstring>& names, ConditionList& list);
  static int QueryRangeCoupled(const Dstring& cmds, std::set<Dstring>& names, ConditionList& list);
  static int QueryCoupled(const char* prefix, const Dstring& cmds, std::set<Dstring>& names, ConditionList& list);
  static int DirtyFlagProc(QenDs* source, void* client, ConditionList& list);
  static int DirtyFlagMatch(QenDs* source, void* client, const Dstring& name);

  static Dstring mCmds;
  static unsigned mInTransaction;
};
