#include "segments/SegmentKeywords.h"

namespace {

template <typename E>
struct Entry {
  E value;
  const char* word;
};

template <typename E, std::size_t N>
const char* WordOf(const Entry<E> (&table)[N], E value, const char* otherwise = "") {
  for (const auto& e : table) {
    if (e.value == value) return e.word;
  }
  return otherwise;
}

// The first entry whose word matches; words compare exactly, as the server writes them.
template <typename E, std::size_t N>
bool ValueOf(const Entry<E> (&table)[N], std::string_view word, E& out) {
  for (const auto& e : table) {
    if (word == e.word) {
      out = e.value;
      return true;
    }
  }
  return false;
}

constexpr Entry<SegmentType> kTypeWords[] = {{SegmentType::kMemory, "MEM"},
                                             {SegmentType::kPrbs, "PRBS"},
                                             {SegmentType::kPrws, "PRWS"},
                                             {SegmentType::kSfi5, "SFI5"},
                                             {SegmentType::kNone, "MEM"}};
constexpr Entry<SegmentType> kTypeTexts[] = {{SegmentType::kMemory, "Pattern Data"},
                                             {SegmentType::kPrbs, "Pseudo Random Bit Stream"},
                                             {SegmentType::kPrws, "Pseudo Random Word Stream"},
                                             {SegmentType::kSfi5, "Serdes Framer Interface 5"}};
constexpr Entry<SegmentType> kTypeShortTexts[] = {{SegmentType::kMemory, "MEMORY"},
                                                  {SegmentType::kPrbs, "PRBS"},
                                                  {SegmentType::kPrws, "PRWS"},
                                                  {SegmentType::kSfi5, "SFI5"}};

constexpr Entry<PRxSLogic> kLogicWords[] = {{PRxSLogic::kNormal, "NORMAL"},
                                            {PRxSLogic::kInverted, "INVERTED"}};
constexpr Entry<PRxSLogic> kLogicTexts[] = {{PRxSLogic::kNormal, "Normal"},
                                            {PRxSLogic::kInverted, "Inverted"}};

constexpr Entry<PRxSSubType> kSubTypeWords[] = {{PRxSSubType::kPure, "PURE"},
                                                {PRxSSubType::kErrored, "ERRORED"},
                                                {PRxSSubType::kDensity, "DENSITY"},
                                                {PRxSSubType::kExtendedZero, "EXTENDED"},
                                                {PRxSSubType::kExtendedOne, "EXTENDED"}};
constexpr Entry<PRxSSubType> kExtensionWords[] = {{PRxSSubType::kExtendedZero, "ZERO"},
                                                  {PRxSSubType::kExtendedOne, "ONE"}};

constexpr Entry<PRxSDensity> kDensityWords[] = {{PRxSDensity::k1of8, "1/8"},
                                                {PRxSDensity::k1of4, "1/4"},
                                                {PRxSDensity::k1of2, "1/2"},
                                                {PRxSDensity::k3of4, "3/4"},
                                                {PRxSDensity::k7of8, "7/8"}};

constexpr Entry<VectorTrace> kVectorTraceWords[] = {{VectorTrace::kVector, "VECT"},
                                                    {VectorTrace::kTrace, "TRAC"}};
constexpr Entry<InsertMode> kInsertWords[] = {{InsertMode::kBefore, "BEF"}, {InsertMode::kAfter, "AFT"}};
constexpr Entry<MirrorMode> kMirrorWords[] = {{MirrorMode::kTrace, "TRAC"}, {MirrorMode::kVector, "VECT"}};
constexpr Entry<Direction> kDirectionWords[] = {{Direction::kLsbFirst, "LSB"}, {Direction::kMsbFirst, "MSB"}};
constexpr Entry<DeleteMode> kDeleteWords[] = {{DeleteMode::kNormal, "NORM"}, {DeleteMode::kClear, "CLR"}};
constexpr Entry<FindDirection> kFindCommands[] = {{FindDirection::kPrevious, "FIND:PREV?"},
                                                  {FindDirection::kNext, "FIND:NEXT?"},
                                                  {FindDirection::kFirst, "FIND:FIRS?"}};

}  // namespace

const char* SegmentKeywords::Word(SegmentType type) {
  return WordOf(kTypeWords, type);
}
bool SegmentKeywords::From(std::string_view word, SegmentType& out) {
  return ValueOf(kTypeWords, word, out);
}
const char* SegmentKeywords::DisplayText(SegmentType type) {
  return WordOf(kTypeTexts, type, "unknown");
}
const char* SegmentKeywords::ShortText(SegmentType type) {
  return WordOf(kTypeShortTexts, type, "unknown");
}

const char* SegmentKeywords::Word(PRxSLogic logic) {
  return WordOf(kLogicWords, logic);
}
bool SegmentKeywords::From(std::string_view word, PRxSLogic& out) {
  return ValueOf(kLogicWords, word, out);
}
const char* SegmentKeywords::DisplayText(PRxSLogic logic) {
  return WordOf(kLogicTexts, logic, "unknown");
}

const char* SegmentKeywords::Word(PRxSSubType subType) {
  return WordOf(kSubTypeWords, subType);
}
const char* SegmentKeywords::ExtensionWord(PRxSSubType subType) {
  return WordOf(kExtensionWords, subType);
}
bool SegmentKeywords::From(std::string_view word, PRxSSubType& out) {
  return ValueOf(kSubTypeWords, word, out);
}
bool SegmentKeywords::FromExtension(std::string_view word, PRxSSubType& out) {
  return ValueOf(kExtensionWords, word, out);
}

const char* SegmentKeywords::Word(PRxSDensity density) {
  return WordOf(kDensityWords, density);
}
bool SegmentKeywords::From(std::string_view word, PRxSDensity& out) {
  return ValueOf(kDensityWords, word, out);
}

const char* SegmentKeywords::Word(VectorTrace which) {
  return WordOf(kVectorTraceWords, which);
}
const char* SegmentKeywords::Word(InsertMode mode) {
  return WordOf(kInsertWords, mode);
}
const char* SegmentKeywords::Word(MirrorMode mode) {
  return WordOf(kMirrorWords, mode);
}
const char* SegmentKeywords::Word(Direction direction) {
  return WordOf(kDirectionWords, direction);
}
const char* SegmentKeywords::Word(DeleteMode mode) {
  return WordOf(kDeleteWords, mode);
}
const char* SegmentKeywords::FindCommand(FindDirection direction) {
  return WordOf(kFindCommands, direction);
}
