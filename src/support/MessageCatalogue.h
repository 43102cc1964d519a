#pragma once

#include <string_view>
#include <vector>

#include "support/Dstring.h"

// The English texts of the "GUI_…" message keys, compiled in from resources/messages.txt.
class MessageCatalogue {
 public:
  // The text of the key, or null when the catalogue has none.
  static const Dstring* Find(std::string_view key);
  // Places the arguments into the text: "%1" is the first argument, "%%" a percent sign.
  static Dstring Expand(std::string_view text, const std::vector<Dstring>& args);
  static std::vector<Dstring> Keys();
};
