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

LispList LispList::OfElements(std::vector<LispList> elements) {
  LispList list;
  std::get<kList>(list.mNode) = std::move(elements);
  return list;
}

const DataItem& LispList::GetItem() const {
  static const DataItem kNoItem;
  const DataItem* item = std::get_if<kItem>(&mNode);
  return item ? *item : kNoItem;
}

const std::vector<LispList>& LispList::Children() const {
  static const std::vector<LispList> kNoChildren;
  const std::vector<LispList>* children = std::get_if<kList>(&mNode);
  return children ? *children : kNoChildren;
}

std::vector<LispList>& LispList::MutableChildren() {
  if (IsItem()) mNode.emplace<kList>();
  return std::get<kList>(mNode);
}

void LispList::Insert(std::size_t at, LispList child) {
  std::vector<LispList>& children = MutableChildren();
  children.insert(children.begin() + static_cast<std::ptrdiff_t>(std::min(at, children.size())), std::move(child));
}

void LispList::Erase(std::size_t at) {
  std::vector<LispList>* children = std::get_if<kList>(&mNode);
  if (children && at < children->size()) children->erase(children->begin() + static_cast<std::ptrdiff_t>(at));
}

void LispList::Clear() {
  if (std::vector<LispList>* children = std::get_if<kList>(&mNode)) children->clear();
}

Dstring LispList::AsExpression() const {
  Dstring out;
  Write(*this, out);
  return out;
}

bool LispList::operator==(const LispList& other) const {
  return mNode == other.mNode;
}
