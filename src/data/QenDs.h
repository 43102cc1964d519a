#pragma once

#include <cstdint>
#include <vector>

#include "data/DsNfyListEntry.h"
#include "support/ConditionList.h"

class QenDsView;

// An observable holder of one piece of instrument state. Reference-counted: created with one
// reference, deleted by the Release that takes the count to zero. Update tells every view and
// procedure in registration order; views may register and unregister while being told.
class QenDs {
 public:
  QenDs() = default;
  virtual ~QenDs() = default;
  QenDs(const QenDs&) = delete;
  QenDs& operator=(const QenDs&) = delete;

  // Notifies every registration; with `block` nonzero the pass first asks the guard
  // "QenDs::Update" and does nothing when it blocks. Stops at the first nonzero status.
  virtual int Update(ConditionList& list, unsigned block);
  virtual unsigned Use();
  virtual unsigned Release();
  virtual unsigned NumRefs() const { return mRefCount; }
  virtual unsigned NumViews() const { return static_cast<unsigned>(mNfyList.size()); }
  virtual int RegisterView(QenDsView* view, ConditionList& list);
  virtual int UnregisterView(QenDsView* view, ConditionList& list);
  virtual void RegisterProc(QenDsProc proc, QenDsMatchProc matchProc, void* client);
  virtual void RegisterProc(QenDsProc proc, void* client);
  virtual void UnregisterProc(QenDsProc proc, QenDsMatchProc matchProc, void* client);
  virtual void UnregisterProc(QenDsProc proc, void* client);

  // A pin keeps the object alive across a pass that works on it without being a reference:
  // Use, Release, NumRefs and the engines' free decide as if no pass ran. A Release that takes
  // the count to zero while pinned leaves the deletion to the last Unpin.
  void Pin() { ++mPins; }
  void Unpin();

 protected:
  const std::vector<DsNfyListEntry>& GetNfyList() const { return mNfyList; }
  // Notifies one registration; the dirty-flag source filters by name before calling it.
  int Notify(const DsNfyListEntry& entry, ConditionList& list);
  // Whether the registration of the copy is still live (it may have gone during the pass).
  bool IsStillRegistered(const DsNfyListEntry& entry, std::uint64_t removalsAtStart) const;
  std::uint64_t GetRemovals() const { return mRemovals; }

 private:
  void Append(DsNfyListEntry entry);
  void EraseAt(std::size_t index);

  unsigned mRefCount = 1;
  unsigned mPins = 0;
  std::vector<DsNfyListEntry> mNfyList;
  std::uint64_t mNextSerial = 1;
  std::uint64_t mRemovals = 0;
};
