#include "params/CBoxItem.h"

#include <cmath>
#include <cstdlib>

#include "params/ValueText.h"

CBoxItem CBoxItem::FromLabel(const Dstring& label) {
  CBoxItem item;
  const auto mark = label.find_first_of("#$");
  if (mark == Dstring::npos) {
    item.text = label;
    item.shown = label;
    return item;
  }
  const auto equals = label.find('=', mark + 1);
  item.kind = label[mark] == '#' ? kNumber : kString;
  item.text = label.substr(mark + 1, equals == Dstring::npos ? Dstring::npos : equals - mark - 1);
  item.shown = equals == Dstring::npos ? item.text : Dstring(label.substr(equals + 1));
  if (item.kind == kNumber) item.number = std::strtod(item.text.c_str(), nullptr);
  return item;
}

int CBoxItem::Choose(const std::vector<CBoxItem>& items, const Dstring& reply) {
  const Dstring trimmed = reply.Trimmed();
  const double number = ValueText::ReadReplyNumber(trimmed);
  int best = -1;
  double bestDistance = 0.0;
  for (std::size_t i = 0; i < items.size(); ++i) {
    const CBoxItem& item = items[i];
    if (item.kind == kString) {
      if (item.text == trimmed) return static_cast<int>(i);
      continue;
    }
    if (std::isnan(number)) continue;
    const double distance = std::fabs(item.number - number);
    if (best < 0 || distance < bestDistance) {
      best = static_cast<int>(i);
      bestDistance = distance;
    }
  }
  return best;
}
