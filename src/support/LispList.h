#pragma once

#include <cstddef>
#include <cstdint>
#include <new>
#include <utility>

#include "support/DataItem.h"

// The parsed list form of a reply or expression: a tree whose leaves are items
// and whose inner nodes are parenthesised lists. A node is either, never both, so it
// is no larger than an item: 48 bytes. A list's elements lie in one array cut from the node
// arena; a list that knows its elements own nothing more frees that array without visiting them.
class LispList {
 public:
  LispList() noexcept : mIsList(true), mPlain(true) { new (&mChildren) Array(); }
  explicit LispList(DataItem item) noexcept : mIsList(false) { new (&mItem) DataItem(std::move(item)); }
  // An empty word, to be written in place.
  explicit LispList(std::in_place_t) noexcept : mIsList(false) { new (&mItem) DataItem(); }
  LispList(const LispList& other) : mIsList(other.mIsList), mPlain(other.mPlain) { CopyFrom(other); }
  LispList(LispList&& other) noexcept : mIsList(other.mIsList), mPlain(other.mPlain) { MoveFrom(other); }
  LispList& operator=(const LispList& other);
  LispList& operator=(LispList&& other) noexcept;
  ~LispList() { Destroy(); }

  // A list that takes over the `count` nodes at `first`, moved into an array of exactly their
  // number; what is left at `first` owns nothing and only awaits destruction.
  static LispList Adopt(LispList* first, std::size_t count);

  bool IsList() const { return mIsList; }
  bool IsItem() const { return !mIsList; }

  // Valid only for an item; a list answers an empty word.
  const DataItem& GetItem() const;
  // The item to write in place; null for a list.
  DataItem* GetMutableItem() { return mIsList ? nullptr : &mItem; }

  // Valid only for a list; an item has no elements.
  std::size_t Size() const { return mIsList ? mChildren.size : 0; }
  const LispList& operator[](std::size_t i) const { return begin()[i]; }
  LispList& operator[](std::size_t i) { return MutableChildren().data[i]; }
  void Append(LispList child);
  void Append(DataItem item) { Append(LispList(std::move(item))); }
  void Insert(std::size_t at, LispList child);
  void Erase(std::size_t at);
  void Clear();
  void Reserve(std::size_t n);
  const LispList* begin() const { return mIsList ? mChildren.data : nullptr; }
  const LispList* end() const { return begin() + Size(); }

  // Written back as parsed: a list as "(a,b,(c))", an item as DataItem::AsExpression.
  Dstring AsExpression() const;

  bool operator==(const LispList& other) const;

 private:
  // A list's elements: an array from the node arena, of `capacity` nodes.
  struct Array {
    LispList* data = nullptr;
    std::uint32_t size = 0;
    std::uint32_t capacity = 0;
  };

  // Owns nothing beyond its own storage: freed without a walk.
  bool OwnsNothing() const { return mIsList ? mChildren.capacity == 0 : mItem.IsInPlace(); }
  // An item that is asked to hold elements becomes a list; the caller may change any element.
  Array& MutableChildren();
  // Room for `n` elements; only a larger array is made.
  void Grow(std::size_t n);

  // Each is called on a node whose own content is destroyed (or not yet built).
  void CopyFrom(const LispList& other);
  void MoveFrom(LispList& other) noexcept {
    if (mIsList) {
      new (&mChildren) Array(other.mChildren);
      other.mChildren = Array();
      other.mPlain = true;
    } else {
      new (&mItem) DataItem(std::move(other.mItem));
    }
  }
  void Destroy() noexcept {
    if (!mIsList) {
      mItem.~DataItem();
    } else if (mChildren.capacity != 0) {
      DestroyChildren();
    }
  }
  void DestroyChildren() noexcept;

  bool mIsList;
  // A list whose elements all own nothing beyond themselves (items with their text in place).
  bool mPlain = true;
  union {
    DataItem mItem;
    Array mChildren;
  };
};
