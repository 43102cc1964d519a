#pragma once

#include <initializer_list>
#include <string_view>

#include "support/ConditionList.h"

// Adds conditions whose text comes from the message catalogue by key ("GUI_SEQUENCE_SYNTAX").
class ConditionListLoader {
 public:
  // Adds the catalogue text of `key` with "%1", "%2", ... replaced by the arguments.
  // An unknown key still adds a condition: the key itself followed by its arguments.
  static void ConditionToken(ConditionList& list, std::string_view key,
                             std::initializer_list<Dstring> args = {}, long code = 0);
};
