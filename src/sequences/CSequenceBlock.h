#pragma once

#include <cstddef>
#include <memory>
#include <set>
#include <vector>

#include "sequences/SequencePorts.h"
#include "sequences/SequenceTypes.h"
#include "support/DataParcel.h"
#include "support/Dstring.h"
#include "support/NodeAllocator.h"
#include "support/NodeArena.h"

class SequenceSegmentSync;

// One block of the sequence: one segment item per port and the block's attributes, its
// reaction (branch) table, and a pointer per loop level to the loop it is in (not owned).
class SequenceTypes::CSequenceBlock {
 public:
  // One entry of the branch table.
  struct Reaction {
    Dstring ifCondition;
    Dstring gotoTarget;
    unsigned long trigger = 0;
    Dstring vxiTrigger;
    bool operator==(const Reaction&) const = default;
  };

  CSequenceBlock() = default;

  // A long sequence is tens of thousands of blocks, made and dropped at every read: they lie
  // in the order they are read, beside their segments, and go back whole with the model.
  static void* operator new(std::size_t size) {
    return NodeArena::Allocate(NodeArena::Stream::Records, size);
  }
  static void operator delete(void* block, std::size_t size) noexcept { NodeArena::Free(block, size); }

  // A copy of everything but the loops.
  std::unique_ptr<CSequenceBlock> CloneContent() const;
  // Equal in everything but the loops.
  bool SameContent(const CSequenceBlock& other) const;

  // Port p is item p - 1: a quoted string names a segment of the pool, a word is a keyword.
  const DataParcel& GetSegments() const { return mSegments; }
  DataParcel& Segments() { return mSegments; }
  // Pads with the ports' default items (DefaultItem) or cuts to exactly `numPorts` items.
  void FitPorts(unsigned long numPorts, const SequencePorts& ports);
  static SeqSegType TypeOf(const DataItem& item);
  // The keyword of a built-in kind; null for SEG_NAMED and values out of range.
  static const char* KeywordOf(SeqSegType type);
  // The item for a kind: a quoted `name` for SEG_NAMED, else the kind's keyword.
  static DataItem ItemOf(SeqSegType type, const Dstring& name);

  unsigned long GetLength() const { return mLength; }
  void SetLength(unsigned long length) { mLength = length; }
  unsigned long GetTrigger() const { return mTrigger; }
  void SetTrigger(unsigned long trigger) { mTrigger = trigger; }
  unsigned long GetMeasurementStart() const { return mMeasurementStart; }
  void SetMeasurementStart(unsigned long start) { mMeasurementStart = start; }
  const Dstring& GetVXITrigger() const { return mVxi; }
  void SetVXITrigger(const Dstring& vxi) { mVxi = vxi; }
  const Dstring& GetLabel() const { return mLabel; }
  void SetLabel(const Dstring& label) { mLabel = label; }
  unsigned GetSync() const { return mSync; }
  void SetSync(unsigned sync) { mSync = sync; }
  const std::vector<Reaction>& GetReactions() const { return mReactions; }
  std::vector<Reaction>& Reactions() { return mReactions; }

  // Null when the block is in no loop on that level (or the level is 0).
  CLoop* GetLoop(unsigned long level) const {
    return level >= 1 && level <= mLoops.size() ? mLoops[level - 1] : nullptr;
  }
  void SetLoop(unsigned long level, CLoop* loop);
  void ClearLoops() { mLoops.clear(); }

  // Hands each named segment not yet in `done` to `sync`, under the guard
  // "CSequence::CSequenceBlock::SyncSegments"; stops at the first failure.
  int SyncSegments(SequenceSegmentSync& sync, std::set<Dstring>& done, ConditionList& cond) const;
  // The default segment of `port`: asks the server for the system
  // configuration, under the guard "CSequence::CSequenceBlock::SetDefaultSegment".
  int SetDefaultSegment(unsigned long port, SequencePorts::Source source, ConditionList& cond);
  // The default item of `port` from the configuration known, without asking the server.
  static DataItem DefaultItem(unsigned long port, const SequencePorts& ports);

 private:
  DataParcel mSegments;
  unsigned long mLength = 0;
  unsigned long mTrigger = 0;
  unsigned long mMeasurementStart = 0;
  Dstring mVxi;
  Dstring mLabel;
  unsigned mSync = 0;
  std::vector<Reaction> mReactions;
  std::vector<CLoop*, NodeAllocator<CLoop*>> mLoops;
};
