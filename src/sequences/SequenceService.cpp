#include "sequences/SequenceService.h"

#include "sequences/CSequence.h"

CSequence* SequenceService::mSequence = nullptr;

void SequenceService::Init(DirtyFlagDs* dirtyFlag, SequencePorts::Source ports) {
  End();
  mSequence = new CSequence;
  mSequence->SetPortSource(ports);
  if (dirtyFlag) mSequence->AttachDirtyFlag(dirtyFlag);
}

void SequenceService::End() {
  delete mSequence;  // its destructor leaves the dirty-flag source
  mSequence = nullptr;
  CSequence::EndNumLoopLevels();
  CSequence::ClearClipboard();
}

int SequenceService::NfyPortInfo(void*, ConditionList& cond) {
  return mSequence ? mSequence->NfyPortInfo(cond) : 0;
}
