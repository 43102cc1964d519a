#pragma once

#include "sequences/CSequenceObserver.h"

// A view that only needs to know that the sequence changed, not what: every report of a read
// becomes NfyChanged, which returns 0 or a status that stops the analysis.
class SequenceChangeObserver : public CSequenceObserver {
 public:
  virtual int NfyChanged(ConditionList& cond) = 0;

  int NfyBlockInserted(unsigned long, ConditionList& c) override { return NfyChanged(c); }
  int NfyBlockDeleted(unsigned long, ConditionList& c) override { return NfyChanged(c); }
  int NfyBlockLabelChanged(unsigned long, ConditionList& c) override { return NfyChanged(c); }
  int NfyBlockLengthChanged(unsigned long, ConditionList& c) override { return NfyChanged(c); }
  int NfyBlockMeasureChanged(unsigned long, ConditionList& c) override { return NfyChanged(c); }
  int NfyBlockSyncChanged(unsigned long, ConditionList& c) override { return NfyChanged(c); }
  int NfyBlockTriggerChanged(unsigned long, ConditionList& c) override { return NfyChanged(c); }
  int NfyBlockVXITriggerChanged(unsigned long, ConditionList& c) override { return NfyChanged(c); }
  int NfyBlockReactionsChanged(unsigned long, ConditionList& c) override { return NfyChanged(c); }
  int NfySegmentChanged(unsigned long, unsigned long, ConditionList& c) override { return NfyChanged(c); }
  int NfyLoopInserted(long, long, long, long, ConditionList& c) override { return NfyChanged(c); }
  int NfyLoopDeleted(long, long, long, long, ConditionList& c) override { return NfyChanged(c); }
  int NfyLoopIterationsChanged(long, long, long, long, ConditionList& c) override { return NfyChanged(c); }
  int NfyLoopTriggerChanged(long, long, long, long, ConditionList& c) override { return NfyChanged(c); }
  int NfyLoopVXITriggerChanged(long, long, long, long, ConditionList& c) override { return NfyChanged(c); }
  int NfyUpdateLoops(ConditionList& c) override { return NfyChanged(c); }
  int NfyEventsChanged(ConditionList& c) override { return NfyChanged(c); }
  int NfySequence(ConditionList& c) override { return NfyChanged(c); }
};
