#include "support/MessageCatalogue.h"

#include <cctype>
#include <map>

extern const char* const kMessageCatalogueText;

namespace {

Dstring Unescape(std::string_view text) {
  Dstring out;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] == '\\' && i + 1 < text.size() && text[i + 1] == 'n') {
      out += '\n';
      ++i;
    } else {
      out += text[i];
    }
  }
  return out;
}

const std::map<std::string, Dstring, std::less<>>& Table() {
  static const auto table = [] {
    std::map<std::string, Dstring, std::less<>> t;
    std::string_view all(kMessageCatalogueText);
    while (!all.empty()) {
      auto nl = all.find('\n');
      std::string_view line = all.substr(0, nl);
      all = nl == std::string_view::npos ? std::string_view{} : all.substr(nl + 1);
      auto tab = line.find('\t');
      if (line.empty() || line[0] == '#' || tab == std::string_view::npos) continue;
      t.emplace(std::string(line.substr(0, tab)), Unescape(line.substr(tab + 1)));
    }
    return t;
  }();
  return table;
}

}  // namespace

const Dstring* MessageCatalogue::Find(std::string_view key) {
  const auto& table = Table();
  auto it = table.find(key);
  return it == table.end() ? nullptr : &it->second;
}

Dstring MessageCatalogue::Expand(std::string_view text, const std::vector<Dstring>& args) {
  Dstring out;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] != '%' || i + 1 >= text.size()) {
      out += text[i];
      continue;
    }
    char next = text[i + 1];
    if (next == '%') {
      out += '%';
      ++i;
    } else if (std::isdigit(static_cast<unsigned char>(next)) && next != '0') {
      std::size_t index = static_cast<std::size_t>(next - '1');
      if (index < args.size()) out += args[index];
      ++i;
    } else {
      out += '%';
    }
  }
  return out;
}

std::vector<Dstring> MessageCatalogue::Keys() {
  std::vector<Dstring> keys;
  for (const auto& [key, text] : Table()) keys.emplace_back(key);
  return keys;
}
