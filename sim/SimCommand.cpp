#include "SimCommand.h"

#include <algorithm>
#include <cctype>

namespace {

constexpr const char* kBlanks = " \t\r\n";

// Where the last definite-length block of the text ends (0 when there is none): its bytes are
// data, blanks or not.
std::size_t LastBlockEnd(std::string_view text) {
  std::size_t last = 0;
  bool quoted = false;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] == '"') quoted = !quoted;
    if (quoted || text[i] != '#' || i + 1 >= text.size() || text[i + 1] < '1' || text[i + 1] > '9') continue;
    const std::size_t digits = static_cast<std::size_t>(text[i + 1] - '0');
    if (i + 2 + digits > text.size()) return last;
    std::size_t length = 0;
    for (std::size_t k = i + 2; k < i + 2 + digits; ++k) {
      if (!std::isdigit(static_cast<unsigned char>(text[k]))) return last;
      length = length * 10 + static_cast<std::size_t>(text[k] - '0');
    }
    const std::size_t end = i + 2 + digits + length;
    if (end > text.size()) return last;
    last = end;
    i = end - 1;
  }
  return last;
}

// Blanks around the text go, but not into the bytes of a block.
std::string_view Trim(std::string_view text) {
  auto first = text.find_first_not_of(kBlanks);
  if (first == std::string_view::npos) return {};
  text.remove_prefix(first);
  const std::size_t end = std::max(text.find_last_not_of(kBlanks) + 1, LastBlockEnd(text));
  return text.substr(0, end);
}

}  // namespace

SimCommand::SimCommand(std::string_view text) {
  std::string_view trimmed = Trim(text);
  std::size_t blank = trimmed.find_first_of(" \t");
  Dstring header(trimmed.substr(0, blank));
  if (blank != std::string_view::npos) mArgs = Dstring(Trim(trimmed.substr(blank + 1)));
  mQuery = header.EndsWith("?");
  if (mQuery) header.pop_back();
  if (header.StartsWith(":")) header.erase(0, 1);
  if (!header.empty()) mPath = DstringList::Split(header.ToUpper(), ':');
}

Dstring SimCommand::PathFrom(std::size_t from) const {
  Dstring out;
  for (std::size_t i = from; i < mPath.size(); ++i) out += ":" + mPath[i];
  return out;
}
