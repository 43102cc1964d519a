#include "support/LispList.h"

#include <algorithm>
#include <limits>
#include <memory>

#include "support/NodeArena.h"

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

LispList* NewArray(std::size_t n) {
  if (n > std::numeric_limits<std::uint32_t>::max()) throw std::bad_array_new_length();
  return static_cast<LispList*>(NodeArena::Allocate(NodeArena::Stream::Trees, n * sizeof(LispList)));
}

void FreeArray(LispList* data, std::size_t n) noexcept {
  NodeArena::Free(data, n * sizeof(LispList));
}

}  // namespace

LispList LispList::Adopt(LispList* first, std::size_t count) {
  LispList list;
  if (count == 0) return list;
  LispList* data = NewArray(count);
  bool plain = true;
  for (std::size_t i = 0; i < count; ++i) {
    plain &= first[i].OwnsNothing();
    new (&data[i]) LispList(std::move(first[i]));
  }
  list.mChildren = Array{data, static_cast<std::uint32_t>(count), static_cast<std::uint32_t>(count)};
  list.mPlain = plain;
  return list;
}

void LispList::CopyFrom(const LispList& other) {
  if (!mIsList) {
    new (&mItem) DataItem(other.mItem);
    return;
  }
  new (&mChildren) Array();
  if (other.mChildren.size == 0) return;
  mChildren.data = NewArray(other.mChildren.size);
  mChildren.capacity = other.mChildren.size;
  try {
    for (; mChildren.size < other.mChildren.size; ++mChildren.size) {
      new (&mChildren.data[mChildren.size]) LispList(other.mChildren.data[mChildren.size]);
    }
  } catch (...) {
    DestroyChildren();
    throw;
  }
}

void LispList::DestroyChildren() noexcept {
  if (!mPlain) std::destroy_n(mChildren.data, mChildren.size);
  FreeArray(mChildren.data, mChildren.capacity);
}

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
    mPlain = taken.mPlain;
    MoveFrom(taken);
  }
  return *this;
}

const DataItem& LispList::GetItem() const {
  static const DataItem kNoItem;
  return mIsList ? kNoItem : mItem;
}

LispList::Array& LispList::MutableChildren() {
  if (!mIsList) {
    mItem.~DataItem();
    mIsList = true;
    new (&mChildren) Array();
  }
  mPlain = false;
  return mChildren;
}

void LispList::Grow(std::size_t n) {
  Array& children = MutableChildren();
  if (n <= children.capacity) return;
  LispList* data = NewArray(n);
  for (std::uint32_t i = 0; i < children.size; ++i) {
    new (&data[i]) LispList(std::move(children.data[i]));
    children.data[i].~LispList();
  }
  FreeArray(children.data, children.capacity);
  children.data = data;
  children.capacity = static_cast<std::uint32_t>(n);
}

void LispList::Reserve(std::size_t n) {
  Grow(n);
}

void LispList::Append(LispList child) {
  Insert(Size(), std::move(child));
}

void LispList::Insert(std::size_t at, LispList child) {
  Array& children = MutableChildren();
  if (children.size == children.capacity) Grow(std::max<std::size_t>(4, 2 * std::size_t{children.size}));
  LispList* data = children.data;
  at = std::min<std::size_t>(at, children.size);
  new (&data[children.size]) LispList(std::move(child));
  std::rotate(data + at, data + children.size, data + children.size + 1);
  ++children.size;
}

void LispList::Erase(std::size_t at) {
  if (!mIsList || at >= mChildren.size) return;
  LispList* data = mChildren.data;
  std::move(data + at + 1, data + mChildren.size, data + at);
  data[--mChildren.size].~LispList();
}

void LispList::Clear() {
  if (!mIsList) return;
  std::destroy_n(mChildren.data, mChildren.size);
  mChildren.size = 0;
}

Dstring LispList::AsExpression() const {
  Dstring out;
  Write(*this, out);
  return out;
}

bool LispList::operator==(const LispList& other) const {
  if (mIsList != other.mIsList) return false;
  if (!mIsList) return mItem == other.mItem;
  return std::equal(begin(), end(), other.begin(), other.end());
}
