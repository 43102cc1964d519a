#include "sequences/SequenceLoopRules.h"

#include <cctype>

#include "instrument/QenGuiInst.h"
#include "sequences/CLoop.h"
#include "sequences/CSequence.h"
#include "support/ConditionListLoader.h"

namespace {

Dstring Number(unsigned long n) {
  return Dstring::Format("%lu", n);
}

int Refuse(ConditionList& cond, std::string_view key, std::initializer_list<Dstring> args) {
  ConditionListLoader::ConditionToken(cond, key, args, CSequence::kStatusError);
  return CSequence::kStatusError;
}

}  // namespace

int SequenceLoopRules::Check(const CSequence& sequence, unsigned long first, unsigned long last,
                             unsigned long level, ConditionList& cond) {
  for (unsigned long b = first; b <= last; ++b) {
    if (sequence.GetLoopStatus(b, level) != CSequence::LOOP_NONE) {
      return Refuse(cond, "GUI_SEQUENCE_LOOP_TAKEN", {Number(first), Number(last), Number(level), Number(b)});
    }
  }
  for (const auto& loop : sequence.GetLoops()) {
    const unsigned long start = loop->GetStart();
    const unsigned long end = loop->GetEnd();
    if (end < first || start > last) continue;
    const bool holds = loop->GetLevel() < level && start >= first && end <= last;
    const bool inside = loop->GetLevel() > level && start <= first && end >= last;
    if (!holds && !inside) {
      return Refuse(
          cond, "GUI_SEQUENCE_LOOP_CROSSES",
          {Number(first), Number(last), Number(level), Number(loop->GetLevel()), Number(start), Number(end)});
    }
  }
  return 0;
}

unsigned long SequenceLoopRules::FreeLevel(const CSequence& sequence, unsigned long first, unsigned long last,
                                           ConditionList& cond) {
  for (unsigned long level = 1; level <= CSequence::GetNumLoopLevels(); ++level) {
    ConditionList ignored;
    if (Check(sequence, first, last, level, ignored) == 0) return level;
  }
  Refuse(cond, "GUI_SEQUENCE_LOOP_NO_LEVEL", {Number(first), Number(last)});
  return 0;
}

int SequenceLoopRules::ParseCount(const Dstring& text, unsigned long largest, unsigned long& count,
                                  ConditionList& cond) {
  const Dstring trimmed = text.Trimmed();
  unsigned long n = 0;
  bool digits = !trimmed.empty() && trimmed.size() <= 19;
  for (const char c : trimmed) digits = digits && std::isdigit(static_cast<unsigned char>(c));
  if (!digits || !trimmed.ToULong(n) || n == 0 || (largest != 0 && n > largest)) {
    return Refuse(cond, "GUI_SEQUENCE_LOOP_COUNT",
                  {trimmed, largest != 0 ? Dstring("1 to " + Number(largest)) : Dstring("1 or more")});
  }
  count = n;
  return 0;
}

int SequenceLoopRules::SetCount(CSequence& sequence, unsigned long block, unsigned long level,
                                const Dstring& text, unsigned long largest, ConditionList& cond) {
  if (level == CSequence::GetNumLoopLevels())
    return Refuse(cond, "GUI_SEQUENCE_LOOP_ENDLESS", {Number(level)});
  unsigned long count = 0;
  if (int status = ParseCount(text, largest, count, cond)) return status;
  return sequence.SetNumIterations(block, level, count, cond);
}

int SequenceLoopRules::ReadLargestCount(unsigned long& largest, ConditionList& cond) {
  Dstring reply;
  const Dstring cmd = Dstring::Format(":%s:SGEN:GLOB:SEQ:ITER:MAX?", QenGuiInst::GetAppHandle().c_str());
  if (int status = QenGuiInst::Call(cmd, reply, cond)) return status;
  unsigned long n = 0;
  if (!reply.Trimmed().ToULong(n) || n == 0) return Refuse(cond, "GUI_SEQUENCE_LOOP_LIMIT", {reply});
  largest = n;
  return 0;
}
