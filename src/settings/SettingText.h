#pragma once

#include <string_view>
#include <vector>

#include "support/Dstring.h"

// A whole setting, or a sequence alone, as one readable text of lines: the file that File ›
// Export Setting and the sequence editors' Export Sequence write, and what the instrument sends
// and takes for ":MMEM:SETT:DATA" and ":SGEN:GLOB:SEQ:DATA". docs/settings.md, "The setting
// text", has the format. Reading checks the whole text and names the first line that is wrong;
// writing gives the one canonical text of what is held, so that a text written, read and
// written again is the same byte for byte, and every value comes back exactly as it was.
class SettingText {
 public:
  enum class Kind { kSetting, kSequence };
  struct Value {
    Dstring header;  // ":CGR1:PER", as given
    Dstring text;    // the value as the instrument writes it: "1e-09", "SEQ", "\"a text\""
    int line = 0;    // where it was read, 0 when it was not
  };
  struct Connection {
    Dstring generator;
    Dstring analyser;
    int line = 0;
  };
  // Where a text is wrong: its line, counted from 1, and what is wrong there.
  struct Problem {
    int line = 0;
    Dstring what;
  };

  static constexpr int kVersion = 1;

  explicit SettingText(Kind kind = Kind::kSetting) : mKind(kind) {}

  // Reads a text of `kind`; false with the problem, `out` then unchanged.
  static bool Read(std::string_view text, Kind kind, SettingText& out, Problem& problem);
  // The text of what is held, in the canonical order: values, profile, connections, sequence,
  // events, end. A legacy text is only ever read.
  Dstring Write() const;

  Kind GetKind() const { return mKind; }
  // A setting qensim kept before a setting held the sequence (first line "qensim setting 1"):
  // values and profile only.
  bool IsLegacy() const { return mLegacy; }

  const std::vector<Value>& GetValues() const { return mValues; }
  void AddValue(const Dstring& header, const Dstring& text) { mValues.push_back({header, text, 0}); }
  const Dstring& GetProfile() const { return mProfile; }
  void SetProfile(const Dstring& profile) { mProfile = profile; }
  const std::vector<Connection>& GetConnections() const { return mConnections; }
  void AddConnection(const Dstring& generator, const Dstring& analyser) {
    mConnections.push_back({generator, analyser, 0});
  }
  bool HasSequence() const { return mHasSequence; }
  const Dstring& GetSequence() const { return mSequence; }
  int GetSequenceLine() const { return mSequenceLine; }
  void SetSequence(const Dstring& sequence);
  // A sequence text of an instrument without a central module has no events.
  bool HasEvents() const { return mHasEvents; }
  const Dstring& GetEvents() const { return mEvents; }
  int GetEventsLine() const { return mEventsLine; }
  void SetEvents(const Dstring& events);
  // The line of "end"; where a problem of the text as a whole is named.
  int GetEndLine() const { return mEndLine; }

 private:
  class Reader;

  Kind mKind;
  bool mLegacy = false;
  std::vector<Value> mValues;
  Dstring mProfile;
  std::vector<Connection> mConnections;
  bool mHasSequence = false;
  Dstring mSequence;
  int mSequenceLine = 0;
  bool mHasEvents = false;
  Dstring mEvents;
  int mEventsLine = 0;
  int mEndLine = 0;
};
