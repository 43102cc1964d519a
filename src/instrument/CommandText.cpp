#include "instrument/CommandText.h"

#include "instrument/QenStatus.h"
#include "support/ConditionListLoader.h"

namespace {

const char* Offence(char c) {
  if (c == '"') return "a double quote";
  if (c == ';') return "\";\", which would start another command";
  if (c == '\n' || c == '\r') return "a line break";
  if (static_cast<unsigned char>(c) < 0x20 || c == 0x7f) return "a control character";
  return nullptr;
}

}  // namespace

int CommandText::CheckArgument(std::string_view text, ConditionList& list) {
  for (char c : text) {
    if (const char* offence = Offence(c)) {
      ConditionListLoader::ConditionToken(list, "GUI_COMMAND_BAD_TEXT", {Dstring(text), Dstring(offence)},
                                          QenStatus::kBadCommand);
      return QenStatus::kBadCommand;
    }
  }
  return QenStatus::kOk;
}
