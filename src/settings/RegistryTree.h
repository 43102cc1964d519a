#pragma once

#include <map>
#include <string_view>

#include "support/Dstring.h"

// The registry's key tree held in memory: what the in-memory store keeps, and what the
// registry file holds, with the file's text form. Operations return null on success, else the
// reason for the condition.
//
// The text form: the line "qengui registry 1", then per key a line "[HKEY_CURRENT_USER\path]"
// followed by its values as "name=data" lines, then the line "end". "%", "=", "[", "]" and
// control characters are written as "%XX" where they would break a line, so any name or data
// survives; a text without its "end" line is refused as cut short.
class RegistryTree {
 public:
  const char* Query(void* root, const Dstring& key, const Dstring& name, Dstring& data) const;
  const char* Set(void* root, const Dstring& key, const Dstring& name, const Dstring& data);
  const char* HasValue(void* root, const Dstring& key, const Dstring& name, bool& exists) const;
  const char* HasKey(void* root, const Dstring& key, bool& exists) const;
  const char* DeleteValue(void* root, const Dstring& key, const Dstring& name);
  const char* DeleteKey(void* root, const Dstring& key);

  Dstring ToText() const;
  // False with `problem` ("line 4: ...") when the text is not a whole registry file.
  static bool FromText(std::string_view text, RegistryTree& out, Dstring& problem);

 private:
  struct Value {
    Dstring name;
    Dstring data;
  };
  struct Key {
    Dstring path;
    std::map<Dstring, Value> values;  // by upper-case name
  };

  // The full path "HKEY_CURRENT_USER\key", or the reason it has none.
  static const char* FullPath(void* root, const Dstring& key, Dstring& path);
  // The key, or null when there is none; the reason when the path itself is bad.
  const char* FindKey(void* root, const Dstring& key, const Key*& found) const;
  // Creates the key of a full path and every key above it.
  Key& MakeKey(const Dstring& path);
  bool ReadLine(const Dstring& line, Key*& key);

  std::map<Dstring, Key> mKeys;  // by upper-case full path
};
