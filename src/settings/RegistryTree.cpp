#include "settings/RegistryTree.h"

#include "settings/RegistryStore.h"
#include "support/DstringList.h"

namespace {

constexpr std::string_view kHeader = "qengui registry 1";
constexpr std::string_view kEnd = "end";
constexpr const char* kNoKey = "the key does not exist";
constexpr const char* kNoValue = "the value does not exist";

struct RootName {
  void* (*root)();
  const char* name;
};

constexpr RootName kRoots[] = {
    {&RegistryStore::CurrentUser, "HKEY_CURRENT_USER"},
    {&RegistryStore::LocalMachine, "HKEY_LOCAL_MACHINE"},
};

const char* NameOfRoot(void* root) {
  for (const RootName& r : kRoots) {
    if (r.root() == root) return r.name;
  }
  return nullptr;
}

bool IsControl(char c) { return static_cast<unsigned char>(c) < 0x20 || c == 0x7f; }

// Elements between backslashes, none empty, no control characters.
bool IsKeyPath(std::string_view key) {
  if (key.empty()) return false;
  for (const Dstring& element : DstringList::Split(key, '\\')) {
    if (element.empty()) return false;
    for (char c : element) {
      if (IsControl(c)) return false;
    }
  }
  return true;
}

// "%XX" for every character of `special` and every control character.
Dstring Escape(std::string_view text, std::string_view special) {
  Dstring out;
  for (char c : text) {
    if (IsControl(c) || special.find(c) != std::string_view::npos) {
      out.AppendPrintf("%%%02X", static_cast<unsigned char>(c));
    } else {
      out += c;
    }
  }
  return out;
}

int HexDigit(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  return -1;
}

bool Unescape(std::string_view text, Dstring& out) {
  out.clear();
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] != '%') {
      out += text[i];
      continue;
    }
    int high = i + 2 < text.size() ? HexDigit(text[i + 1]) : -1;
    int low = high >= 0 ? HexDigit(text[i + 2]) : -1;
    if (low < 0) return false;
    out += static_cast<char>(high * 16 + low);
    i += 2;
  }
  return true;
}

// The root and the key of a full path "HKEY_CURRENT_USER\path"; false when it is none.
bool SplitFullPath(const Dstring& full, void*& root, Dstring& key) {
  std::size_t at = full.find('\\');
  for (const RootName& r : kRoots) {
    if (at != Dstring::npos && full.substr(0, at) == r.name) {
      root = r.root();
      key = full.substr(at + 1);
      return IsKeyPath(key);
    }
  }
  return false;
}

}  // namespace

const char* RegistryTree::FullPath(void* root, const Dstring& key, Dstring& path) {
  const char* rootName = NameOfRoot(root);
  if (rootName == nullptr) return "the root key is not known";
  if (!IsKeyPath(key)) return "that is not a key path";
  path = Dstring(rootName) + "\\" + key;
  return nullptr;
}

const char* RegistryTree::FindKey(void* root, const Dstring& key, const Key*& found) const {
  Dstring path;
  if (const char* reason = FullPath(root, key, path)) return reason;
  auto it = mKeys.find(path.ToUpper());
  found = it == mKeys.end() ? nullptr : &it->second;
  return nullptr;
}

// The root itself is no key of the tree: the keys above start below it.
RegistryTree::Key& RegistryTree::MakeKey(const Dstring& path) {
  for (std::size_t at = path.find('\\', path.find('\\') + 1); at != Dstring::npos; at = path.find('\\', at + 1)) {
    Dstring above = path.substr(0, at);
    mKeys.try_emplace(above.ToUpper(), Key{above, {}});
  }
  return mKeys.try_emplace(path.ToUpper(), Key{path, {}}).first->second;
}

const char* RegistryTree::Query(void* root, const Dstring& key, const Dstring& name, Dstring& data) const {
  const Key* found = nullptr;
  if (const char* reason = FindKey(root, key, found)) return reason;
  if (found == nullptr) return kNoKey;
  auto it = found->values.find(name.ToUpper());
  if (it == found->values.end()) return kNoValue;
  data = it->second.data;
  return nullptr;
}

const char* RegistryTree::Set(void* root, const Dstring& key, const Dstring& name, const Dstring& data) {
  Dstring path;
  if (const char* reason = FullPath(root, key, path)) return reason;
  Key& made = MakeKey(path);
  Value& value = made.values[name.ToUpper()];
  if (value.name.empty()) value.name = name;
  value.data = data;
  return nullptr;
}

const char* RegistryTree::HasValue(void* root, const Dstring& key, const Dstring& name, bool& exists) const {
  const Key* found = nullptr;
  if (const char* reason = FindKey(root, key, found)) return reason;
  exists = found != nullptr && found->values.contains(name.ToUpper());
  return nullptr;
}

const char* RegistryTree::HasKey(void* root, const Dstring& key, bool& exists) const {
  const Key* found = nullptr;
  if (const char* reason = FindKey(root, key, found)) return reason;
  exists = found != nullptr;
  return nullptr;
}

const char* RegistryTree::DeleteValue(void* root, const Dstring& key, const Dstring& name) {
  const Key* found = nullptr;
  if (const char* reason = FindKey(root, key, found)) return reason;
  if (found == nullptr) return kNoKey;
  auto& values = mKeys.at(found->path.ToUpper()).values;
  return values.erase(name.ToUpper()) == 1 ? nullptr : kNoValue;
}

const char* RegistryTree::DeleteKey(void* root, const Dstring& key) {
  const Key* found = nullptr;
  if (const char* reason = FindKey(root, key, found)) return reason;
  if (found == nullptr) return kNoKey;
  const Dstring upper = found->path.ToUpper();
  auto below = mKeys.lower_bound(upper + "\\");
  if (below != mKeys.end() && below->first.StartsWith(upper + "\\")) return "the key has keys below it";
  mKeys.erase(upper);
  return nullptr;
}

Dstring RegistryTree::ToText() const {
  Dstring out(kHeader);
  out += '\n';
  for (const auto& [upper, key] : mKeys) {
    out += "[" + Escape(key.path, "%[]") + "]\n";
    for (const auto& [upperName, value] : key.values) {
      out += Escape(value.name, "%=[]") + "=" + Escape(value.data, "%") + "\n";
    }
  }
  out += kEnd;
  out += '\n';
  return out;
}

// A key line makes `key` the current key; a value line needs one.
bool RegistryTree::ReadLine(const Dstring& line, Key*& key) {
  Dstring first, second;
  if (line.StartsWith("[") && line.EndsWith("]")) {
    void* root = nullptr;
    if (!Unescape(std::string_view(line).substr(1, line.size() - 2), first) || !SplitFullPath(first, root, second)) {
      return false;
    }
    key = &MakeKey(first);
    return true;
  }
  std::size_t eq = line.find('=');
  if (eq == Dstring::npos || key == nullptr || !Unescape(std::string_view(line).substr(0, eq), first) ||
      !Unescape(std::string_view(line).substr(eq + 1), second)) {
    return false;
  }
  key->values[first.ToUpper()] = Value{first, second};
  return true;
}

bool RegistryTree::FromText(std::string_view text, RegistryTree& out, Dstring& problem) {
  DstringList lines = DstringList::Split(text, '\n');
  // A whole file ends in "end" and a line break, which leaves one empty piece after it.
  if (lines.size() < 3 || lines.back() != "" || lines[lines.size() - 2] != kEnd) {
    problem = "it is cut short (no end line)";
    return false;
  }
  if (lines[0] != kHeader) {
    problem = "line 1: not a registry file";
    return false;
  }
  RegistryTree tree;
  Key* key = nullptr;
  for (std::size_t i = 1; i + 2 < lines.size(); ++i) {
    if (!tree.ReadLine(lines[i], key)) {
      problem = Dstring::Format("line %zu cannot be read", i + 1);
      return false;
    }
  }
  out = std::move(tree);
  return true;
}
