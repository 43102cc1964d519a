#pragma once

#include <cstddef>
#include <vector>

#include "support/DataItem.h"

// The parsed list form of a reply or expression: a tree whose leaves are items
// and whose inner nodes are parenthesised lists.
class LispList {
 public:
  LispList() : mIsList(true) {}
  explicit LispList(DataItem item) : mIsList(false), mItem(std::move(item)) {}

  bool IsList() const { return mIsList; }
  bool IsItem() const { return !mIsList; }

  // Valid only for an item.
  const DataItem& GetItem() const { return mItem; }

  // Valid only for a list.
  std::size_t Size() const { return mChildren.size(); }
  const LispList& operator[](std::size_t i) const { return mChildren[i]; }
  LispList& operator[](std::size_t i) { return mChildren[i]; }
  void Append(LispList child) { mChildren.push_back(std::move(child)); }
  void Append(DataItem item) { mChildren.emplace_back(std::move(item)); }
  void Insert(std::size_t at, LispList child);
  void Erase(std::size_t at);
  void Clear() { mChildren.clear(); }
  void Reserve(std::size_t n) { mChildren.reserve(n); }
  auto begin() const { return mChildren.begin(); }
  auto end() const { return mChildren.end(); }

  // Written back as parsed: a list as "(a,b,(c))", an item as DataItem::AsExpression.
  Dstring AsExpression() const;

  bool operator==(const LispList& other) const;

 private:
  bool mIsList;
  DataItem mItem;
  std::vector<LispList> mChildren;
};
