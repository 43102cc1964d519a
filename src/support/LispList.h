#pragma once

#include <cstddef>
#include <variant>
#include <vector>

#include "support/DataItem.h"

// The parsed list form of a reply or expression: a tree whose leaves are items
// and whose inner nodes are parenthesised lists. A node is either, never both, so it
// is no larger than an item.
class LispList {
 public:
  LispList() : mNode(std::in_place_index<kList>) {}
  explicit LispList(DataItem item) : mNode(std::in_place_index<kItem>, std::move(item)) {}
  // A list that takes over the given elements.
  static LispList OfElements(std::vector<LispList> elements);

  bool IsList() const { return mNode.index() == kList; }
  bool IsItem() const { return mNode.index() == kItem; }

  // Valid only for an item; a list answers an empty word.
  const DataItem& GetItem() const;

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
  static constexpr std::size_t kItem = 0;
  static constexpr std::size_t kList = 1;

  const std::vector<LispList>& Children() const;
  // An item that is asked to hold elements becomes a list.
  std::vector<LispList>& MutableChildren();

  std::variant<DataItem, std::vector<LispList>> mNode;
};
