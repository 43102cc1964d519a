#pragma once

#include <cstdarg>
#include <string>
#include <string_view>

// The string of the whole library: a std::string with printf-style formatting.
// Formatting follows the C library except that every %E/%e conversion writes an
// exponent of at least three digits ("1.5E-003"), the form the instrument expects.
class Dstring : public std::string {
 public:
  using std::string::string;
  Dstring() = default;
  Dstring(const std::string& s) : std::string(s) {}
  Dstring(std::string&& s) noexcept : std::string(std::move(s)) {}
  Dstring(std::string_view s) : std::string(s) {}

  // Replaces the content with the formatted text.
  Dstring& Printf(const char* format, ...) __attribute__((format(printf, 2, 3)));
  Dstring& VPrintf(const char* format, va_list args);
  // Appends the formatted text.
  Dstring& AppendPrintf(const char* format, ...) __attribute__((format(printf, 2, 3)));

  static Dstring Format(const char* format, ...) __attribute__((format(printf, 1, 2)));

  Dstring ToUpper() const;
  Dstring Trimmed() const;
  // The same in place, without a copy (a reply may be megabytes long).
  void Trim();
  bool StartsWith(std::string_view prefix) const { return std::string_view(*this).starts_with(prefix); }
  bool EndsWith(std::string_view suffix) const { return std::string_view(*this).ends_with(suffix); }

  // Reads the whole text as a decimal integer (leading and trailing blanks allowed).
  bool ToLong(long& out) const;
  bool ToULong(unsigned long& out) const;
  bool ToDouble(double& out) const;
};
