#pragma once

#include <cstddef>
#include <vector>

#include "data/DsNfyListEntry.h"
#include "segments/SegmentEnums.h"
#include "segments/SegmentProperties.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

class DirtyFlagDs;
class QenDs;
class QenDsView;
class QenSegmentDs;

// The registry of the segment data sources, one per segment name, and the home of the
// operations that address a segment by name or by server number only. Static: lives from
// Init to End.
//
// Sharing: every name has at most one data source, shared by reference, except the names
// beginning with "Analyzer": each editor of an analyser segment gets a data source of its own.
class QenSegmentPool {
 public:
  // The dirty-flag source (may be null) is followed: when the server reports that an open
  // segment changed, its buffers are read again and its views told.
  static void Init(DirtyFlagDs* dirtyFlag = nullptr);
  static void End();

  // One more reference to the name's data source, made when there is none.
  static QenSegmentDs* AllocDs(const Dstring& name);
  // The name's data source without taking a reference; null when there is none.
  static QenSegmentDs* GetSegmentDsByName(const Dstring& name);
  static QenSegmentDs* GetSegmentDsByNameAndView(const Dstring& name, QenDsView* view, ConditionList& list);
  static QenSegmentDs* GetSegmentDsByNameAndProc(const Dstring& name, QenDsProc proc, void* data);
  static void FreeDs(QenSegmentDs* ds);
  // Allocates and registers in one step; the reference is given back by UnregisterView.
  static int RegisterView(const Dstring& name, QenDsView* view, ConditionList& list);
  static int UnregisterView(QenSegmentDs* ds, QenDsView* view, ConditionList& list);
  static std::size_t NumSources() { return mPool.size(); }

  // Writes the dirty buffers back to the server: of every source, of the name's, of one.
  static int Sync(ConditionList& list);
  static int Sync(const Dstring& name, ConditionList& list);
  static int Sync(QenSegmentDs* ds, ConditionList& list);
  // Reads every source's buffers again and tells its views; every source is read even when
  // one fails, and the first failure is returned.
  static int UpdateAll(ConditionList& list);

  // Makes the segment anew (a segment of that name is deleted first) with the properties,
  // saved under its name; `created` is the number the server gave it, already closed again.
  // A segment that could not be made whole is deleted again.
  static int Create(const SegmentProperties& properties, unsigned& created, ConditionList& list);
  // Opens the name's data source and reads its properties; the caller closes and frees it.
  static int Open(const Dstring& name, SegmentProperties& properties, QenSegmentDs*& opened,
                  ConditionList& list);
  static int Delete(const Dstring& name, ConditionList& list);
  static int Exists(const Dstring& name, bool& exists, ConditionList& list);
  // The names of the saved segments, as the server sorts them.
  static int Catalog(std::vector<Dstring>& names, ConditionList& list);
  static int Save(unsigned number, ConditionList& list);
  static int Close(unsigned number, ConditionList& list);
  static int RealPath(const Dstring& name, Dstring& path, ConditionList& list);
  static int GetType(const Dstring& name, SegmentType& type, ConditionList& list);

  // The dirty-flag registration: a changed name ":<handle>:EDIT:SEGM<n>..." matches when
  // segment n is open here.
  static int NfyMatchDirtyFlag(QenDs* source, void* client, const Dstring& name);
  static int NfyViewDataUpdatedDirtyFlag(QenDs* source, void* client, ConditionList& list);

 private:
  friend class QenSegmentDs;

  static void Enter(QenSegmentDs* ds);
  static void Forget(QenSegmentDs* ds);
  // The segment number a changed name is about; 0 when it is about none.
  static unsigned NumberOf(const Dstring& name);
  static int UpdateWhere(bool all, ConditionList& list);

  static std::vector<QenSegmentDs*> mPool;
  static DirtyFlagDs* mDirtyFlag;
};
