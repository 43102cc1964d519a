#pragma once

#include "support/ConditionList.h"

// The sequence editors' Export Sequence… and Import Sequence…: the instrument's sequence with
// its events in a sequence text file, through SettingTransfer. An import reads the file as the
// model would read the sequence before anything is sent, naming the line that is wrong; after
// it the model reads the instrument's sequence, so every editor shows what was imported.
class SequenceTransfer {
 public:
  static int Export(const Dstring& path, ConditionList& list);
  static int Import(const Dstring& path, ConditionList& list);
};
