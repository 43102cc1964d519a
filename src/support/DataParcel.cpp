#include "support/DataParcel.h"

Dstring DataParcel::AsExpression() const {
  Dstring out;
  for (std::size_t i = 0; i < size(); ++i) {
    if (i > 0) out += ',';
    out += (*this)[i].AsExpression();
  }
  return out;
}
