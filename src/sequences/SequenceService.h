#pragma once

#include "sequences/SequencePorts.h"
#include "support/ConditionList.h"

class CSequence;
class DirtyFlagDs;

// The owner of the one sequence model of the application. Init makes the model, gives it its
// port source and registers it on the dirty-flag source; End undoes that and forgets the
// class-wide loop levels and block clipboard. The application starts it after the port
// information service, so that on a poll a changed configuration is taken before the sequence
// is read.
class SequenceService {
 public:
  static void Init(DirtyFlagDs* dirtyFlag, SequencePorts::Source ports);
  static void End();
  // Null outside Init .. End.
  static CSequence* GetSequence() { return mSequence; }
  // Re-reads the sequence by force after the port configuration changed: the procedure the
  // port information service is given.
  static int NfyPortInfo(void* client, ConditionList& cond);

 private:
  static CSequence* mSequence;
};
