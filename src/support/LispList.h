#pragma once

#include <cstddef>
#include <new>
#include <utility>
#include <vector>

#include "support/DataItem.h"
#include "support/NodeAllocator.h"

// The parsed list form of a reply or expression: a tree whose leaves are items
// and whose inner nodes are parenthesised lists. A node is either, never both, so it
// is no larger than an item: 48 bytes.
class LispList {
 public:
  using Elements = std::vector<LispList, NodeAllocator<LispList>>;

  LispList() noexcept : mIsList(true) { new (&mChildren) Elements(); }
  explicit LispList(DataItem item) noexcept : mIsList(false) { new (&mItem) DataItem(std::move(item)); }
  // An empty word, to be written in place.
  explicit LispList(std::in_place_t) noexcept : mIsList(false) { new (&mItem) DataItem(); }
  LispList(const LispList& other) : mIsList(other.mIsList) { CopyFrom(other); }
  LispList(LispList&& other) noexcept : mIsList(other.mIsList) { MoveFrom(other); }
  LispList& operator=(const LispList& other);
  LispList& operator=(LispList&& other) noexcept;
  ~LispList() { Destroy(); }

  // A list that takes over the given elements.
  static LispList OfElements(Elements elements) { return LispList(std::move(elements)); }

  bool IsList() const { return mIsList; }
  bool IsItem() const { return !mIsList; }

  // Valid only for an item; a list answers an empty word.
  const DataItem& GetItem() const;
  // The item to write in place; null for a list.
  DataItem* GetMutableItem() { return mIsList ? nullptr : &mItem; }

  // Valid only for a list; an item has no elements.
  std::size_t Size() const { return Children().size(); }
  const LispList& operator[](std::size_t i) const { return Children()[i]; }
  LispList& operator[](std::size_t i) { return MutableChildren()[i]; }
  void Append(LispList child) { MutableChildren().push_back(std::move(child)); }
  void Append(DataItem item) { MutableChildren().emplace_back(std::move(item)); }
  void Insert(std::size_t at, LispList child);
  void Erase(std::size_t at);
  void Clear();
  void Reserve(std::size_t n) { MutableChildren().reserve(n); }
  auto begin() const { return Children().begin(); }
  auto end() const { return Children().end(); }

  // Written back as parsed: a list as "(a,b,(c))", an item as DataItem::AsExpression.
  Dstring AsExpression() const;

  bool operator==(const LispList& other) const;

 private:
  explicit LispList(Elements&& elements) noexcept : mIsList(true) { new (&mChildren) Elements(std::move(elements)); }

  const Elements& Children() const;
  // An item that is asked to hold elements becomes a list.
  Elements& MutableChildren();

  // Each is called on a node whose own content is destroyed (or not yet built).
  void CopyFrom(const LispList& other) {
    if (mIsList) {
      new (&mChildren) Elements(other.mChildren);
    } else {
      new (&mItem) DataItem(other.mItem);
    }
  }
  void MoveFrom(LispList& other) noexcept {
    if (mIsList) {
      new (&mChildren) Elements(std::move(other.mChildren));
    } else {
      new (&mItem) DataItem(std::move(other.mItem));
    }
  }
  void Destroy() noexcept {
    if (mIsList) {
      mChildren.~Elements();
    } else {
      mItem.~DataItem();
    }
  }

  bool mIsList;
  union {
    DataItem mItem;
    Elements mChildren;
  };
};
