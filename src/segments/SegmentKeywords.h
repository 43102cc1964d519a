#pragma once

#include <string_view>

#include "segments/SegmentEnums.h"
#include "support/Dstring.h"

// The words of the segment enumerations on the wire and on the screen. A "Word" function
// returns "" for a value outside the enumeration; a "From" function returns false for a word
// outside it and leaves `out` alone.
class SegmentKeywords {
 public:
  static const char* Word(SegmentType type);
  static bool From(std::string_view word, SegmentType& out);
  // "Pattern Data", ...; "unknown" outside the enumeration.
  static const char* DisplayText(SegmentType type);
  // "MEMORY", ...; "unknown" outside the enumeration.
  static const char* ShortText(SegmentType type);

  static const char* Word(PRxSLogic logic);
  static bool From(std::string_view word, PRxSLogic& out);
  static const char* DisplayText(PRxSLogic logic);

  // "PURE", "ERRORED", "DENSITY", "EXTENDED" (both extended kinds).
  static const char* Word(PRxSSubType subType);
  // The extension word of an extended kind ("ZERO", "ONE"); empty for the others.
  static const char* ExtensionWord(PRxSSubType subType);
  // The kind from its word and, for "EXTENDED", the extension word.
  static bool From(std::string_view word, PRxSSubType& out);
  static bool FromExtension(std::string_view word, PRxSSubType& out);

  static const char* Word(PRxSDensity density);
  static bool From(std::string_view word, PRxSDensity& out);

  static const char* Word(VectorTrace which);
  static const char* Word(InsertMode mode);
  static const char* Word(MirrorMode mode);
  static const char* Word(Direction direction);
  static const char* Word(DeleteMode mode);
  // "FIND:PREV?", "FIND:NEXT?", "FIND:FIRS?".
  static const char* FindCommand(FindDirection direction);
};
