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
  if (blank != std::string_view::npos) mArgs = Trim(trimmed.substr(blank + 1));
  mQuery = header.EndsWith("?");
  if (mQuery) header.pop_back();
  if (header.StartsWith(":")) header.erase(0, 1);
  if (!header.empty()) mPath = DstringList::Split(header.ToUpper(), ':');
}

bool SimCommand::SplitTrailingBlock(std::string_view& head, std::string_view& bytes) const {
  const std::size_t hash = mArgs.find('#');
  if (hash == std::string_view::npos) return false;
  const std::string_view before = mArgs.substr(0, hash);
  const std::size_t comma = before.find_last_not_of(" \t");
  if (before.find_first_of("\"'()") != std::string_view::npos) return false;
  if (comma == std::string_view::npos || mArgs[comma] != ',' || hash + 2 > mArgs.size()) return false;
  const char n = mArgs[hash + 1];
  if (n < '1' || n > '9') return false;
  const std::size_t data = hash + 2 + static_cast<std::size_t>(n - '0');
  if (data > mArgs.size()) return false;
  std::size_t length = 0;
  for (std::size_t i = hash + 2; i < data; ++i) {
    if (!std::isdigit(static_cast<unsigned char>(mArgs[i]))) return false;
    length = length * 10 + static_cast<std::size_t>(mArgs[i] - '0');
  }
  if (length != mArgs.size() - data) return false;
  head = mArgs.substr(0, comma);
  bytes = mArgs.substr(data);
  return true;
}

Dstring SimCommand::PathFrom(std::size_t from) const {
  Dstring out;
  for (std::size_t i = from; i < mPath.size(); ++i) out += ":" + mPath[i];
  return out;
}
