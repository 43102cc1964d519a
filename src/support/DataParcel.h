#pragma once

#include <vector>

#include "support/DataItem.h"
#include "support/NodeAllocator.h"

// An ordered, flat list of typed values. Its array is cut from the node arena: replies and
// sequence blocks make and drop them by the thousand.
class DataParcel : public std::vector<DataItem, NodeAllocator<DataItem>> {
 public:
  using std::vector<DataItem, NodeAllocator<DataItem>>::vector;

  // The items joined by "," in expression form.
  Dstring AsExpression() const;
};
