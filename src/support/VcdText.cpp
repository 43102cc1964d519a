#include "support/VcdText.h"

namespace {

constexpr int kFirstCode = 33;
constexpr int kCodes = 94;

}  // namespace

Dstring VcdText::Identifier(std::size_t index) {
  Dstring id;
  do {
    id += static_cast<char>(kFirstCode + index % kCodes);
    index /= kCodes;
  } while (index > 0);
  return id;
}

Dstring VcdText::ScopeName(const Dstring& scope, const char* fallback) {
  Dstring name;
  for (char c : scope) {
    if (c == ':' || c == '/') {
      if (!name.empty()) name += '_';
    } else if (c > ' ' && c < 127) {
      name += c;
    }
  }
  return name.empty() ? Dstring(fallback) : name;
}

void VcdText::Wire(std::ostream& out, const Dstring& id, const Dstring& name) {
  out << "$var wire 1 " << id << ' ' << name << " $end\n";
}

void VcdText::AddChange(Dstring& changes, char value, const Dstring& id) {
  changes += value;
  changes += id;
  changes += '\n';
}

void VcdText::Step(std::ostream& out, unsigned long long time, const Dstring& changes, bool first) {
  out << '#' << time << '\n';
  if (first)
    out << "$dumpvars\n" << changes << "$end\n";
  else
    out << changes;
}
