#pragma once

#include "support/ConditionList.h"
#include "support/Dstring.h"

class CSequence;

// What a sequence editor's typed cell becomes, the same in every editor: a length is a whole
// number of vectors above 0; a segment is a kind word (PAUSE, PAUSE0 ..., in any case) or the
// name of a segment that exists on the instrument, refused before anything is written when it
// does not (the sequence takes any name, and the instrument would only find out at the run).
class SequenceCellEdit {
 public:
  static int SetLength(CSequence& sequence, unsigned long block, const Dstring& text, ConditionList& cond);
  static int SetSegment(CSequence& sequence, unsigned long block, unsigned long port, const Dstring& text,
                        ConditionList& cond);
};
