#include "support/LispList.h"

#include <algorithm>

namespace {

// Appends into one string, so writing a large tree stays linear in its size.
void Write(const LispList& node, Dstring& out) {
  if (node.IsItem()) {
    out += node.GetItem().AsExpression();
    return;
  }
  out += '(';
  for (std::size_t i = 0; i < node.Size(); ++i) {
    if (i > 0) out += ',';
    Write(node[i], out);
  }
  out += ')';
}

}  // namespace

void LispList::Insert(std::size_t at, LispList child) {
  mChildren.insert(mChildren.begin() + static_cast<std::ptrdiff_t>(std::min(at, mChildren.size())),
                   std::move(child));
}

void LispList::Erase(std::size_t at) {
  if (at < mChildren.size()) mChildren.erase(mChildren.begin() + static_cast<std::ptrdiff_t>(at));
}

Dstring LispList::AsExpression() const {
  Dstring out;
  Write(*this, out);
  return out;
}

bool LispList::operator==(const LispList& other) const {
  if (mIsList != other.mIsList) return false;
  return mIsList ? mChildren == other.mChildren : mItem == other.mItem;
}
