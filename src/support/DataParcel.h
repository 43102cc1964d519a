#pragma once

#include <vector>

#include "support/DataItem.h"

// An ordered, flat list of typed values.
class DataParcel : public std::vector<DataItem> {
 public:
  using std::vector<DataItem>::vector;

  // The items joined by "," in expression form.
  Dstring AsExpression() const;
};
