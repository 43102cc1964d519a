#include "sequences/BlockReactionTable.h"

#include "sequences/CSequence.h"

bool BlockReactionTable::HasBlock() const { return mBlock >= 1 && mBlock <= mSequence.GetNumBlocks(); }

unsigned long BlockReactionTable::Rows() const { return HasBlock() ? mSequence.GetBlockNumBranches(mBlock) : 0; }

Dstring BlockReactionTable::Heading(unsigned long column) {
  static const char* const kHeadings[kColumns] = {"If", "Go to label", "Trigger", "VXI trigger"};
  return column < kColumns ? kHeadings[column] : "";
}

Dstring BlockReactionTable::Text(unsigned long n, unsigned long column) const {
  if (n >= Rows()) return {};
  switch (column) {
    case kIf:
      return mSequence.GetReactIf(mBlock, n);
    case kGoto:
      return mSequence.GetReactGoto(mBlock, n);
    case kTrigger:
      return Dstring::Format("%lu", mSequence.GetReactTrig(mBlock, n));
    case kVxi:
      return mSequence.GetReactVxi(mBlock, n);
    default:
      return {};
  }
}

bool BlockReactionTable::IsEditable(bool locked) const {
  return !locked && HasBlock() && mSequence.GetBlockSync(mBlock) == 0;
}

int BlockReactionTable::Write(unsigned long n, unsigned long column, const Dstring& text, ConditionList& cond) const {
  const Dstring value = text.Trimmed();
  switch (column) {
    case kIf:
      return mSequence.SetReactIf(mBlock, n, value, cond);
    case kGoto:
      return mSequence.SetReactGoto(mBlock, n, value, cond);
    case kVxi:
      return mSequence.SetReactVxi(mBlock, n, value, cond);
    default:
      break;
  }
  unsigned long trigger = 0;
  if (value.empty() || value.find_first_not_of("0123456789") != Dstring::npos || !value.ToULong(trigger)) {
    cond.Add(1, Dstring::Format("\"%s\" is no trigger: a whole number from 0.", value.c_str()));
    return 1;
  }
  return mSequence.SetReactTrig(mBlock, n, trigger, cond);
}
