#include "instrument/CommandText.h"

#include <array>

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

int Refuse(std::string_view text, const char* offence, ConditionList& list) {
  ConditionListLoader::ConditionToken(list, "GUI_COMMAND_BAD_TEXT", {Dstring(text), Dstring(offence)},
                                      QenStatus::kBadCommand);
  return QenStatus::kBadCommand;
}

}  // namespace

int CommandText::CheckArgument(std::string_view text, ConditionList& list) {
  for (char c : text) {
    if (const char* offence = Offence(c)) return Refuse(text, offence, list);
  }
  return QenStatus::kOk;
}

int CommandText::CheckValue(std::string_view text, ConditionList& list) {
  // Most of a long value (a sequence of thousands of blocks) is plain text: it is passed over
  // by a table before the quote rules look at a character.
  static const auto kPlain = [] {
    std::array<bool, 256> plain{};
    for (int c = 0; c < 256; ++c) {
      plain[static_cast<std::size_t>(c)] = Offence(static_cast<char>(c)) == nullptr && c != '\'';
    }
    return plain;
  }();
  char quote = 0;
  for (char c : text) {
    if (kPlain[static_cast<unsigned char>(c)]) continue;
    if (quote == 0 && (c == '"' || c == '\'')) {
      quote = c;
    } else if (c == quote) {
      quote = 0;
    } else if (const char* offence = Offence(c); offence && (c != ';' || quote == 0) && c != '"') {
      return Refuse(text, offence, list);
    }
  }
  return quote ? Refuse(text, "a quote that is never closed", list) : QenStatus::kOk;
}

int CommandText::CheckLine(std::string_view text, ConditionList& list) {
  for (char c : text) {
    if (c != '"' && c != ';' && Offence(c) != nullptr) return Refuse(text, Offence(c), list);
  }
  return QenStatus::kOk;
}

Dstring CommandText::ExpandHandle(const Dstring& line, const Dstring& handle) {
  Dstring out;
  bool commandStart = true;
  bool quoted = false;
  for (std::size_t i = 0; i < line.size(); ++i) {
    const char c = line[i];
    if (commandStart && c == ':' && i + 1 < line.size() && line[i + 1] == ':') {
      out += ":" + handle;
      commandStart = false;
      continue;
    }
    if (c == '"') quoted = !quoted;
    commandStart = !quoted && c == ';';
    out += c;
  }
  return out;
}
