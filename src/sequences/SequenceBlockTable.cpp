#include "sequences/SequenceBlockTable.h"

#include "sequences/CSequence.h"
#include "sequences/SequenceCellEdit.h"

unsigned long SequenceBlockTable::Rows() const { return mSequence.GetNumBlocks(); }

unsigned long SequenceBlockTable::Columns() const { return kFirstPort + mSequence.GetNumPorts(); }

Dstring SequenceBlockTable::Heading(unsigned long column) {
  return column == kLabel ? "Label" : column == kLength ? "Length" : "";
}

Dstring SequenceBlockTable::Text(unsigned long block, unsigned long column) const {
  if (block < 1 || block > Rows() || column >= Columns()) return {};
  if (column == kLabel) return mSequence.GetLabel(block);
  if (column == kLength) return Dstring::Format("%lu", mSequence.GetBlockLength(block));
  return mSequence.GetSegment(block, PortOf(column));
}

Dstring SequenceBlockTable::NamedSegment(unsigned long block, unsigned long column) const {
  if (block < 1 || block > Rows() || column < kFirstPort || column >= Columns()) return {};
  const unsigned long port = PortOf(column);
  return mSequence.GetType(block, port) == CSequence::SEG_NAMED ? mSequence.GetSegment(block, port) : Dstring();
}

bool SequenceBlockTable::IsEditable(bool locked) const { return !locked && mSequence.GetLoops().empty(); }

int SequenceBlockTable::Write(unsigned long block, unsigned long column, const Dstring& text,
                              ConditionList& cond) const {
  const Dstring typed = text.Trimmed();
  if (column == kLabel) return mSequence.SetLabel(block, typed, cond);
  if (column == kLength) return SequenceCellEdit::SetLength(mSequence, block, typed, cond);
  return SequenceCellEdit::SetSegment(mSequence, block, PortOf(column), typed, cond);
}
