#include "sequences/SequenceCellEdit.h"

#include "segments/QenSegmentPool.h"
#include "sequences/CSequence.h"
#include "sequences/CSequenceBlock.h"

namespace {

CSequence::SeqSegType KindOf(const Dstring& text) {
  const Dstring upper = text.ToUpper();
  for (int type = CSequence::SEG_PAUSE; type <= CSequence::SEG_DONTCARE; ++type) {
    const auto kind = static_cast<CSequence::SeqSegType>(type);
    if (upper == CSequence::CSequenceBlock::KeywordOf(kind)) return kind;
  }
  return CSequence::SEG_NAMED;
}

}  // namespace

int SequenceCellEdit::SetLength(CSequence& sequence, unsigned long block, const Dstring& text,
                                ConditionList& cond) {
  const Dstring trimmed = text.Trimmed();
  unsigned long length = 0;
  const bool digits = !trimmed.empty() && trimmed.find_first_not_of("0123456789") == Dstring::npos;
  if (!digits || !trimmed.ToULong(length) || length == 0) {
    cond.Add(
        1, Dstring::Format("\"%s\" is no block length: a whole number of vectors above 0.", trimmed.c_str()));
    return 1;
  }
  return sequence.SetBlockLength(block, length, cond);
}

int SequenceCellEdit::SetSegment(CSequence& sequence, unsigned long block, unsigned long port,
                                 const Dstring& text, ConditionList& cond) {
  const Dstring name = text.Trimmed();
  const CSequence::SeqSegType kind = KindOf(name);
  if (kind == CSequence::SEG_NAMED) {
    bool exists = false;
    if (int status = QenSegmentPool::Exists(name, exists, cond)) return status;
    if (!exists) {
      cond.Add(1, Dstring::Format(
                      "There is no segment \"%s\" on the instrument: make it in the segment editor first.",
                      name.c_str()));
      return 1;
    }
  }
  return sequence.SetSegment(block, port, name, cond, kind);
}
