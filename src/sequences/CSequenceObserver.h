#pragma once

#include "support/ConditionList.h"

// What a sequence view (the loop grid, the simple sequence editor) is told after each read of
// the sequence, in this order (docs/sequences.md, "Change analysis"):
//  1. block changes, walking the blocks from the first: NfyBlockDeleted and NfyBlockInserted
//     in the numbering the view has at that moment (all earlier reports applied), and for a
//     block that stayed in place the attributes that changed (label, length, measure, sync,
//     trigger, VXI trigger, reactions, then NfySegmentChanged port by port);
//  2. loop changes in the final numbering: NfyLoopDeleted for loops that went (with their
//     old numbers), NfyLoopInserted for new ones, the ...Changed reports for loops that kept
//     their blocks; then NfyUpdateLoops once when any loop came or went;
//  3. NfySequence alone, instead of all of the above, when the whole view must be rebuilt
//     (the number of ports changed, a forced read, or too many changes to pair).
// The model already holds the new content. Each report returns 0, or a status that stops the
// analysis (the read then fails and the model is put back). Every report has a default that
// does nothing, so a view overrides what it shows.
class CSequenceObserver {
 public:
  virtual ~CSequenceObserver() = default;

  virtual int NfyBlockInserted(unsigned long /*block*/, ConditionList&) { return 0; }
  virtual int NfyBlockDeleted(unsigned long /*block*/, ConditionList&) { return 0; }
  virtual int NfyBlockLabelChanged(unsigned long /*block*/, ConditionList&) { return 0; }
  virtual int NfyBlockLengthChanged(unsigned long /*block*/, ConditionList&) { return 0; }
  virtual int NfyBlockMeasureChanged(unsigned long /*block*/, ConditionList&) { return 0; }
  virtual int NfyBlockSyncChanged(unsigned long /*block*/, ConditionList&) { return 0; }
  virtual int NfyBlockTriggerChanged(unsigned long /*block*/, ConditionList&) { return 0; }
  virtual int NfyBlockVXITriggerChanged(unsigned long /*block*/, ConditionList&) { return 0; }
  // The branch table of the block changed (the loop grid may ignore it).
  virtual int NfyBlockReactionsChanged(unsigned long /*block*/, ConditionList&) { return 0; }
  virtual int NfySegmentChanged(unsigned long /*block*/, unsigned long /*port*/, ConditionList&) { return 0; }

  // A loop is described by its level, first block, length in blocks and iterations (0: endless).
  virtual int NfyLoopInserted(long /*level*/, long /*start*/, long /*length*/, long /*iterations*/,
                              ConditionList&) {
    return 0;
  }
  virtual int NfyLoopDeleted(long /*level*/, long /*start*/, long /*length*/, long /*iterations*/,
                             ConditionList&) {
    return 0;
  }
  virtual int NfyLoopIterationsChanged(long /*level*/, long /*start*/, long /*length*/, long /*iterations*/,
                                       ConditionList&) {
    return 0;
  }
  virtual int NfyLoopTriggerChanged(long /*level*/, long /*start*/, long /*length*/, long /*iterations*/,
                                    ConditionList&) {
    return 0;
  }
  virtual int NfyLoopVXITriggerChanged(long /*level*/, long /*start*/, long /*length*/, long /*iterations*/,
                                       ConditionList&) {
    return 0;
  }
  virtual int NfyUpdateLoops(ConditionList&) { return 0; }
  // The table of sequence events read differs from the one before (told after the reports
  // of the sequence, or alone when the sequence stayed).
  virtual int NfyEventsChanged(ConditionList&) { return 0; }
  virtual int NfySequence(ConditionList&) { return 0; }
};
