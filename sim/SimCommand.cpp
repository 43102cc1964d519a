#include "SimCommand.h"

SimCommand::SimCommand(std::string_view text) {
  Dstring trimmed = Dstring(text).Trimmed();
  std::size_t blank = trimmed.find_first_of(" \t");
  Dstring header = trimmed.substr(0, blank);
  if (blank != Dstring::npos) mArgs = Dstring(trimmed.substr(blank + 1)).Trimmed();
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
