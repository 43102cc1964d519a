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
class SegmentCatalogDs;

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
  // Every source, in the order they were made.
  static const std::vector<QenSegmentDs*>& GetSources() { return mPool; }

  // The catalogue every list of segments follows; lives from Init to End.
  static SegmentCatalogDs* GetCatalogDs() { return mCatalog; }
  // After this side saved, made or deleted a segment: the catalogue is read again when a list
  // follows it (its conditions are dropped: the operation itself went through).
  static void NfyCatalogChanged();

  // Whether the modified segments keep a copy of their whole text form, so that unsaved work
  // can be written out when the server is gone (QenSegmentDs::GetHeldTexts). Off by default.
  static void SetKeepCopies(bool keep) { mKeepCopies = keep; }

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
  // Whether the segment is open here: made or changed and perhaps not saved, but the server has it.
  static bool IsOpenHere(const Dstring& name);
  // Whether the instrument has the segment: saved (Exists), or open here.
  static int IsAvailable(const Dstring& name, bool& available, ConditionList& list);
  // The names of the saved segments, as the server sorts them.
  static int Catalog(std::vector<Dstring>& names, ConditionList& list);
  static int Save(unsigned number, ConditionList& list);
  static int Close(unsigned number, ConditionList& list);
  static int RealPath(const Dstring& name, Dstring& path, ConditionList& list);
  static int GetType(const Dstring& name, SegmentType& type, ConditionList& list);

  // The dirty-flag registration: a changed name ":<handle>:EDIT:SEGM<n>..." matches when
  // segment n is open here, and ":<handle>:EDIT:SEGM:CAT" (the catalogue) always. A changed
  // segment is told with QenSegmentDs::NfyChangedElsewhere, so digits typed here are not written
  // over another client's change without a word.
  static int NfyMatchDirtyFlag(QenDs* source, void* client, const Dstring& name);
  static int NfyViewDataUpdatedDirtyFlag(QenDs* source, void* client, ConditionList& list);

 private:
  friend class QenSegmentDs;

  static void Enter(QenSegmentDs* ds);
  static void Forget(QenSegmentDs* ds);
  // The segment number a changed name is about; 0 when it is about none.
  static unsigned NumberOf(const Dstring& name);
  static bool IsCatalogName(const Dstring& name);

  static std::vector<QenSegmentDs*> mPool;
  static DirtyFlagDs* mDirtyFlag;
  static SegmentCatalogDs* mCatalog;
  static bool mKeepCopies;
};
