#include "SimSequenceCheck.h"

#include <algorithm>

#include "support/ConditionList.h"
#include "support/LispList.h"
#include "support/ParserExpression.h"

namespace {

constexpr int kShape = -104;
constexpr int kNotPlayable = -224;
constexpr int kOutOfRange = -222;
constexpr const char* kKeywords[] = {"PAUSE",     "PAUSE0",    "PAUSE1",  "ACQUIRE",
                                     "EXPECTED0", "EXPECTED1", "DONTCARE"};
constexpr std::size_t kEvents = 10;

bool IsWord(const LispList& e, std::string_view word) {
  return e.IsItem() && e.GetItem().GetType() == DataItemType::Word &&
         Dstring(e.GetItem().GetText()).ToUpper() == word;
}
bool IsText(const LispList& e) {
  return e.IsItem() && e.GetItem().IsText();
}
bool IsUnsigned(const LispList& e) {
  unsigned long n = 0;
  return e.IsItem() && e.GetItem().IsInteger() && e.GetItem().GetULong(n);
}

class SequenceChecker {
 public:
  SequenceChecker(unsigned long ports, unsigned long levels) : mPorts(ports), mLevels(levels) {}

  // 0 or an error; `level` becomes the highest loop level inside the element.
  int Element(const LispList& e, unsigned long& level) const {
    level = 0;
    if (!e.IsList() || e.Size() == 0) return kShape;
    if (IsWord(e[0], "BLOCK")) return Block(e);
    if (IsWord(e[0], "SEQ")) return Sequential(e, level);
    return Loop(e, level);
  }

 private:
  int Block(const LispList& e) const {
    if (e.Size() < 6 || (e.Size() - 6) % 3 != 0) return kShape;
    if (!IsUnsigned(e[1]) || !IsUnsigned(e[2]) || !IsUnsigned(e[3]) || !IsText(e[4])) return kShape;
    if (!IsWord(e[5], "SYNC")) {
      if (!e[5].IsList()) return kShape;
      for (const LispList& r : e[5]) {
        if (!r.IsList() || r.Size() != 4 || !IsText(r[0]) || !IsText(r[1]) || !IsUnsigned(r[2]) ||
            !IsText(r[3]))
          return kShape;
      }
    }
    for (std::size_t i = 6; i < e.Size(); i += 3) {
      if (int rc = Segment(e[i])) return rc;
      if (!IsUnsigned(e[i + 1]) || !IsUnsigned(e[i + 2])) return kShape;
    }
    return (e.Size() - 6) / 3 == mPorts ? 0 : kNotPlayable;
  }

  static int Segment(const LispList& e) {
    if (!e.IsItem()) return kShape;
    const DataItem& item = e.GetItem();
    if (item.GetType() == DataItemType::String) return item.GetText().empty() ? kNotPlayable : 0;
    if (item.GetType() != DataItemType::Word) return kShape;
    const Dstring word = Dstring(item.GetText()).ToUpper();
    return std::any_of(std::begin(kKeywords), std::end(kKeywords), [&](const char* k) { return word == k; })
               ? 0
               : kNotPlayable;
  }

  int Sequential(const LispList& e, unsigned long& level) const {
    if (e.Size() < 2 || e.Size() % 2 != 0) return kShape;
    for (std::size_t i = 1; i < e.Size(); i += 2) {
      if (i > 1 && !IsText(e[i - 1])) return kShape;
      unsigned long inner = 0;
      if (int rc = Element(e[i], inner)) return rc;
      level = std::max(level, inner);
    }
    return 0;
  }

  int Loop(const LispList& e, unsigned long& level) const {
    if (!e[0].IsItem() || e[0].GetItem().GetType() != DataItemType::Word) return kShape;
    const Dstring word = Dstring(e[0].GetItem().GetText()).ToUpper();
    unsigned long own = 0;
    if (!word.StartsWith("LOOP") || word.size() == 4 || word.size() > 8) return kShape;
    for (std::size_t i = 4; i < word.size(); ++i) {
      if (word[i] < '0' || word[i] > '9') return kShape;
      own = own * 10 + static_cast<unsigned long>(word[i] - '0');
    }
    if (e.Size() != 5 || !IsUnsigned(e[1]) || !(IsUnsigned(e[2]) || IsWord(e[2], "INF")) || !IsText(e[3]))
      return kShape;
    if (own < 1 || own > mLevels) return kNotPlayable;
    unsigned long count = 0;
    if (IsUnsigned(e[2]) && e[2].GetItem().GetULong(count) && count > SimSequenceCheck::kMaxLoopCount) {
      return kOutOfRange;
    }
    unsigned long inner = 0;
    if (int rc = Element(e[4], inner)) return rc;
    if (inner >= own) return kNotPlayable;
    level = own;
    return 0;
  }

  unsigned long mPorts;
  unsigned long mLevels;
};

bool Parse(std::string_view text, LispList& top) {
  ConditionList ignored;
  return ParserExpression::Parse(text, top, ignored) == 0;
}

int CheckEvent(const LispList& e) {
  if (!e.IsList() || e.Size() != 3 || !IsText(e[0]) || !e[1].IsItem() || !e[1].GetItem().IsInteger() ||
      !e[2].IsList()) {
    return kShape;
  }
  for (const LispList& item : e[2]) {
    if (!item.IsList() || item.Size() != 4 || !IsText(item[0]) || !IsText(item[1]) || !IsText(item[2]) ||
        !item[3].IsItem()) {
      return kShape;
    }
  }
  return 0;
}

}  // namespace

int SimSequenceCheck::CheckSequence(std::string_view text, unsigned long dataPorts,
                                    unsigned long loopLevels) {
  LispList top;
  double version = 0.0;
  if (!Parse(text, top) || top.Size() != 3 || !top[0].IsItem() || !top[0].GetItem().IsNumber() ||
      !top[0].GetItem().GetDouble(version) || !IsText(top[1])) {
    return kShape;
  }
  if (!(version > 1.0 && version <= 3.0)) return kNotPlayable;
  const LispList& body = top[2];
  if (IsWord(body, "")) return 0;  // the empty sequence, "(3.0,,)"
  unsigned long level = 0;
  return SequenceChecker(dataPorts, loopLevels).Element(body, level);
}

int SimSequenceCheck::CheckEvents(std::string_view text) {
  LispList top;
  double version = 0.0;
  if (!Parse(text, top) || top.Size() != kEvents + 1 || !top[0].IsItem() || !top[0].GetItem().IsNumber() ||
      !top[0].GetItem().GetDouble(version)) {
    return kShape;
  }
  if (!(version <= 3.0)) return kNotPlayable;
  for (std::size_t i = 1; i <= kEvents; ++i) {
    if (int rc = CheckEvent(top[i])) return rc;
  }
  return 0;
}

Dstring SimSequenceCheck::InitialSequence(const SimSequenceConfig& config, const Dstring& mode) {
  Dstring block = "(BLOCK,0,512,0,\"\",()";
  for (const SimSequenceConfig::Port& port : config.GetPorts()) {
    if (port.portClass != "PDAT") continue;
    const char* kind = port.type == "INPUT_PORT" ? "PAUSE0" : mode == "CAPT" ? "ACQUIRE" : "PAUSE";
    block += Dstring(",") + kind + ",0,0";
  }
  return "(3.0,\"\"," + block + "))";
}

Dstring SimSequenceCheck::InitialEvents() {
  Dstring out = "(3.0";
  for (std::size_t i = 0; i < kEvents; ++i) out += ",(\"\",0,())";
  return out + ")";
}
