#pragma once

#include <memory>
#include <vector>

#include "sequences/CSequenceEvents.h"
#include "sequences/SequenceContent.h"
#include "sequences/SequencePorts.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

class CSequenceObserver;
class DirtyFlagDs;
class FWBlocker;
class QenDs;
class SequenceSegmentSync;

// The client-side model of the pattern generator's sequence: an ordered list
// of blocks, each naming one segment per port, and loops that repeat runs of consecutive blocks
// on a fixed number of nesting levels; with it the table of the ten sequence events.
//
// The sequence lives on the server. The model is read as one text expression, edited in
// memory, and every edit is written back at once as a complete new expression and read back,
// so after every successful edit the model equals what the server accepted. Views are told
// what changed by the change analysis of each read (CSequenceObserver), never by the edit
// itself: an edit that the server refuses is undone before any view has seen it.
//
// Block, port and loop-level numbers count from 1 in every interface; reactions from 0.
// Readers given a number out of range return the neutral value (0, "", LOOP_NONE); editors
// refuse it with a condition and status 1. docs/sequences.md has the rules this class settles.
class CSequence : public SequenceTypes {
 public:
  CSequence();
  virtual ~CSequence();
  CSequence(const CSequence&) = delete;
  CSequence& operator=(const CSequence&) = delete;

  // --- Wiring -----------------------------------------------------------------------------
  // Observers are told in the order they were added; not owned. Removing one that is being
  // told is allowed.
  void AddObserver(CSequenceObserver* observer);
  void RemoveObserver(CSequenceObserver* observer);
  // What SyncSegments hands each named segment to (the segment pool); null for nothing.
  void SetSegmentSync(SequenceSegmentSync* sync) { mSegmentSync = sync; }
  // Registers NfyViewDataUpdatedDirtyFlag with NfyMatchDirtyFlag on the dirty-flag source,
  // and the reverse. Not owned.
  void AttachDirtyFlag(DirtyFlagDs* dirtyFlag);
  void DetachDirtyFlag();
  // Where the sequence learns the system configuration; without one it knows no ports and no
  // central module.
  void SetPortSource(SequencePorts::Source source) { mPortSource = source; }

  // --- Reading ----------------------------------------------------------------------------
  unsigned long GetNumBlocks() const { return mContent.blocks.size(); }
  unsigned long GetNumPorts() const { return mContent.numPorts; }
  // Null when there is no such block.
  const CSequenceBlock* GetBlock(unsigned long block) const;
  const Content& GetContent() const { return mContent; }
  const LoopList& GetLoops() const { return mContent.loops; }
  Dstring GetSegment(unsigned long block, unsigned long port) const;
  SeqSegType GetType(unsigned long block, unsigned long port) const;
  unsigned long GetBlockLength(unsigned long block) const;
  Dstring GetLabel(unsigned long block) const;
  unsigned long GetBlockTrigger(unsigned long block) const;
  unsigned long GetBlockMeasurementStart(unsigned long block) const;
  unsigned GetBlockSync(unsigned long block) const;
  // Whether any block is a synchronisation block.
  bool HasBlockSync() const;
  Dstring GetBlockVXITrigger(unsigned long block) const;
  unsigned long GetBlockNumBranches(unsigned long block) const;
  Dstring GetReactIf(unsigned long block, unsigned long n) const;
  Dstring GetReactGoto(unsigned long block, unsigned long n) const;
  unsigned long GetReactTrig(unsigned long block, unsigned long n) const;
  Dstring GetReactVxi(unsigned long block, unsigned long n) const;

  // Loop queries; 0 (1 for GetNumIterations) when the block is in no loop on that level.
  unsigned long GetLoopStart(unsigned long block, unsigned long level) const;
  unsigned long GetLoopEnd(unsigned long block, unsigned long level) const;
  unsigned long GetLoopLength(unsigned long block, unsigned long level) const;
  unsigned long GetNumIterations(unsigned long block, unsigned long level) const;
  unsigned long GetLoopTrigger(unsigned long block, unsigned long level) const;
  Dstring GetLoopVXITrigger(unsigned long block, unsigned long level) const;
  LOOP_STATUS GetLoopStatus(unsigned long block, unsigned long level) const;
  bool IsBlockInLoop(unsigned long block, unsigned long level) const;
  unsigned long GetHighestLoopLevel(unsigned long block, unsigned long level) const;

  // For hosts and tests that know the number without asking the server.
  static void SetNumLoopLevels(unsigned long levels);
  // Whether the class-wide block clipboard holds a block.
  static bool IsPasteBlockPossible() { return mClipboard != nullptr; }
  // Empties the block clipboard (tests, shut-down).
  static void ClearClipboard();

  const CSequenceEvents& GetEvents() const { return mEvents; }
  // The expression last read from the server; empty before the first read.
  const Dstring& GetLastExpression() const { return mLastExpression; }
  // Forgets the expression last read, so that the next read rebuilds the model whatever the
  // server answers (after the instrument was held by another client).
  void ClearLastExpression() { mLastExpression.clear(); }
  unsigned IsReading() const { return mReading; }

  // --- Editing: each is guarded, changes the model, then WriteSequence ---------------------
  // `newBlock`, when given, is inserted instead of a fresh block; its loops are ignored.
  int AddBlockBefore(unsigned long block, ConditionList& cond,
                     std::unique_ptr<CSequenceBlock> newBlock = nullptr);
  int AddBlockAfter(unsigned long block, ConditionList& cond,
                    std::unique_ptr<CSequenceBlock> newBlock = nullptr);
  int DeleteBlock(unsigned long block, ConditionList& cond);
  int CutBlock(unsigned long block, ConditionList& cond);
  // Copies into the clipboard; changes and writes nothing.
  int CopyBlock(unsigned long block, ConditionList& cond);
  int PasteBlockBefore(unsigned long block, ConditionList& cond);
  int PasteBlockAfter(unsigned long block, ConditionList& cond);
  // Moves the block to position block + distance (1 .. number of blocks).
  int MoveBlock(unsigned long block, long distance, ConditionList& cond);
  // `type` SEG_NAMED takes `name` as a segment of the pool; any other kind its keyword.
  int SetSegment(unsigned long block, unsigned long port, const Dstring& name, ConditionList& cond,
                 SeqSegType type = SEG_NAMED);
  int SetDefaultSegment(unsigned long block, unsigned long port, ConditionList& cond);
  int SetBlockLength(unsigned long block, unsigned long length, ConditionList& cond);
  int SetLabel(unsigned long block, const Dstring& label, ConditionList& cond);
  int SetBlockTrigger(unsigned long block, unsigned long trigger, ConditionList& cond);
  int SetBlockMeasurementStart(unsigned long block, unsigned long start, ConditionList& cond);
  int SetBlockSync(unsigned long block, unsigned sync, ConditionList& cond);
  int SetBlockVXITrigger(unsigned long block, const Dstring& vxi, ConditionList& cond);
  int SetLoop(unsigned long block, unsigned long level, ConditionList& cond, unsigned long length,
              unsigned long iterations, unsigned long trigger, const Dstring& vxi);
  int DeleteLoop(unsigned long block, unsigned long level, ConditionList& cond);
  int SetNumIterations(unsigned long block, unsigned long level, unsigned long iterations,
                       ConditionList& cond);
  int SetLoopTrigger(unsigned long block, unsigned long level, unsigned long trigger, ConditionList& cond);
  int SetLoopVXITrigger(unsigned long block, unsigned long level, const Dstring& vxi, ConditionList& cond);
  int NewReact(unsigned long block, ConditionList& cond);
  int DeleteReact(unsigned long block, unsigned long n, ConditionList& cond);
  int SetReactIf(unsigned long block, unsigned long n, const Dstring& value, ConditionList& cond);
  int SetReactGoto(unsigned long block, unsigned long n, const Dstring& value, ConditionList& cond);
  int SetReactTrig(unsigned long block, unsigned long n, unsigned long value, ConditionList& cond);
  int SetReactVxi(unsigned long block, unsigned long n, const Dstring& value, ConditionList& cond);
  int ClearBranchTable(unsigned long block, ConditionList& cond);
  // Event `index` (from 0) of the table; only a central module has events. A refused write
  // leaves the table as it was.
  int SetEvent(std::size_t index, const CSequenceEvents::Event& event, ConditionList& cond);
  // Clears the start label (the label of block 1); writes nothing when there is none.
  int ClearExistingStartLabel(ConditionList& cond);
  // Hands every named segment of the sequence, once each, to the segment sync (before a run).
  int SyncSegments(ConditionList& cond);

  // --- Server exchange --------------------------------------------------------------------
  static int InitNumLoopLevels(ConditionList& cond);
  static void EndNumLoopLevels();
  // Reads the events (with a central module) and the sequence; with `force` the model is
  // rebuilt and the views refreshed even when the server's text is unchanged.
  int ReadSequence(ConditionList& cond, unsigned force);
  int WriteSequence(ConditionList& cond);
  int asExpression(Dstring& out, ConditionList& cond) const;
  int fromExpression(const Dstring& text, ConditionList& cond);
  // Compares the model (new) with the old content and tells the observers what changed.
  int AnalyzeChanges(const Content& old, ConditionList& cond);
  bool NfyMatchDirtyFlag(const Dstring& cmd) const;
  int NfyViewDataUpdatedDirtyFlag(ConditionList& cond);
  int NfyPortInfo(ConditionList& cond);

 private:
  // Guards an edit: the FWBlocker of `name`, then no edit while reading or analysing.
  int OpenEdit(FWBlocker& guard, ConditionList& cond) const;
  template <typename Change>
  int Edit(const char* name, ConditionList& cond, Change change);

  int CheckBlock(unsigned long block, ConditionList& cond) const;
  int CheckPort(unsigned long port, ConditionList& cond) const;
  int CheckLevel(unsigned long level, ConditionList& cond) const;
  int CheckReact(unsigned long block, unsigned long n, ConditionList& cond) const;
  int CheckLoop(unsigned long block, unsigned long level, ConditionList& cond) const;
  CSequenceBlock* MutableBlock(unsigned long block) const;
  CLoop* LoopAt(unsigned long block, unsigned long level) const;
  // The iterations a loop on `level` keeps when asked for `requested`.
  static unsigned long IterationsFor(unsigned long level, unsigned long requested);
  // Inserts as AddBlockBefore (after = false) or AddBlockAfter does, without guard or write.
  void InsertBlock(unsigned long block, bool after, std::unique_ptr<CSequenceBlock> newBlock);
  std::unique_ptr<CSequenceBlock> ClipboardCopy() const;

  // ReadSequence; `written`, when given, is the text just written from the model.
  int Read(ConditionList& cond, unsigned force, const Dstring* written);
  int TakeWritten(const Dstring& reply, ConditionList& cond);
  int ReadEvents(ConditionList& cond);
  int ReportEvents(ConditionList& cond);
  int WriteEvents(ConditionList& cond);
  // Puts the model back to the last expression read, undoing local edits.
  void RestoreLastExpression();
  int Parse(const Dstring& text, ConditionList& cond);

  SequencePorts Ports(SequencePorts::Ask ask) const;
  bool HasCentral() const { return Ports(SequencePorts::Ask::IfUnknown).central; }

  static int DirtyFlagProc(QenDs* source, void* client, ConditionList& cond);
  static int DirtyFlagMatch(QenDs* source, void* client, const Dstring& name);

  Content mContent;  // number of ports, blocks and loops
  Dstring mLastExpression;
  unsigned mReading = 0;
  unsigned mAnalysing = 0;
  CSequenceEvents mEvents;
  std::vector<CSequenceObserver*> mObservers;
  SequenceSegmentSync* mSegmentSync = nullptr;
  DirtyFlagDs* mDirtyFlag = nullptr;
  SequencePorts::Source mPortSource = nullptr;

  static std::unique_ptr<CSequenceBlock> mClipboard;
};
