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

LispList& LispList::operator=(const LispList& other) {
  if (this != &other) {
    LispList copy(other);
    *this = std::move(copy);
  }
  return *this;
}

LispList& LispList::operator=(LispList&& other) noexcept {
  if (this != &other) {
    // `other` may live inside this node's elements: take it out before they go.
    LispList taken(static_cast<LispList&&>(other));
    Destroy();
    mIsList = taken.mIsList;
    MoveFrom(taken);
  }
  return *this;
}

const DataItem& LispList::GetItem() const {
  static const DataItem kNoItem;
  return mIsList ? kNoItem : mItem;
}

const LispList::Elements& LispList::Children() const {
  static const Elements kNoChildren;
  return mIsList ? mChildren : kNoChildren;
}

LispList::Elements& LispList::MutableChildren() {
  if (!mIsList) {
    mItem.~DataItem();
    mIsList = true;
    new (&mChildren) Elements();
  }
  return mChildren;
}

void LispList::Insert(std::size_t at, LispList child) {
  Elements& children = MutableChildren();
  children.insert(children.begin() + static_cast<std::ptrdiff_t>(std::min(at, children.size())), std::move(child));
}

void LispList::Erase(std::size_t at) {
  if (mIsList && at < mChildren.size()) mChildren.erase(mChildren.begin() + static_cast<std::ptrdiff_t>(at));
}

void LispList::Clear() {
  if (mIsList) mChildren.clear();
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
