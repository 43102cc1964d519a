#pragma once

#include <cstddef>

#include "settings/SettingText.h"
#include "support/ConditionList.h"

// A setting, or the sequence alone, between the instrument and a local file in the setting
// text (File › Export Setting… and Import Setting…, the sequence editors' Export Sequence… and
// Import Sequence…), through the one call path: ":%s:MMEM:SETT:DATA" and ":%s:SGEN:GLOB:SEQ:DATA"
// send and take the text as a block.
//
// What fails leaves things as they were and says so: an export writes the file only once it
// holds the instrument's whole text, checked, and replaces it whole; an import checks the whole
// file first, naming the line that is wrong, and sends nothing then; the instrument takes a
// text all or nothing, and when it refuses (or another client holds it) it keeps what it had.
class SettingTransfer {
 public:
  using Kind = SettingText::Kind;
  // The largest file an import reads; one frame carries at most 16 MiB.
  static constexpr std::size_t kMaxFileBytes = 8 * 1024 * 1024;

  // Reads the instrument's setting or sequence, checks it and writes it to `path`.
  static int Export(Kind kind, const Dstring& path, ConditionList& list);
  // Reads `path` and checks it whole: a text of `kind`, no larger than kMaxFileBytes.
  static int ReadFile(Kind kind, const Dstring& path, SettingText& out, ConditionList& list);
  // Has the instrument take a checked text; `cableDelay` is the choice for a setting's port
  // delays, as for a load.
  static int Send(const SettingText& text, bool cableDelay, ConditionList& list);
  // ReadFile, then Send. The instrument then holds a setting of no name: the open setting
  // ("OPENSETTING_NAME") is emptied.
  static int ImportSetting(const Dstring& path, bool cableDelay, ConditionList& list);
  // Adds what an import that failed leaves: nothing changed. `path` is the file.
  static void SayNotImported(Kind kind, const Dstring& path, int status, ConditionList& list);
};
