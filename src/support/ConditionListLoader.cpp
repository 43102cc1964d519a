#include "support/ConditionListLoader.h"

#include "support/MessageCatalogue.h"

void ConditionListLoader::ConditionToken(ConditionList& list, std::string_view key,
                                         std::initializer_list<Dstring> args, long code) {
  std::vector<Dstring> arguments(args);
  Dstring message;
  if (const Dstring* text = MessageCatalogue::Find(key)) {
    message = MessageCatalogue::Expand(*text, arguments);
  } else {
    message = Dstring(key);
    for (const auto& a : arguments) message += " " + a;
  }
  list.Add(Condition(code, std::move(message), Dstring(key), std::move(arguments)));
}
