#include "support/Dstring.h"

#include <cctype>
#include <cerrno>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace {

enum class Length { None, Char, Short, Long, LongLong, IntMax, Size, PtrDiff, LongDouble };

struct Conversion {
  std::string flags;
  int width = -1;
  int precision = -1;
  Length length = Length::None;
  char conversion = 0;
};

// Reads one conversion after the '%'; returns the position after it.
const char* ParseConversion(const char* p, Conversion& conv, va_list& args) {
  while (*p && std::strchr("-+ #0", *p)) conv.flags += *p++;
  if (*p == '*') {
    conv.width = va_arg(args, int);
    if (conv.width < 0) {
      conv.flags += '-';
      conv.width = -conv.width;
    }
    ++p;
  } else if (std::isdigit(static_cast<unsigned char>(*p))) {
    conv.width = static_cast<int>(std::strtol(p, const_cast<char**>(&p), 10));
  }
  if (*p == '.') {
    ++p;
    if (*p == '*') {
      conv.precision = va_arg(args, int);
      ++p;
    } else {
      conv.precision = static_cast<int>(std::strtol(p, const_cast<char**>(&p), 10));
    }
  }
  static const struct { const char* text; Length length; } kLengths[] = {
      {"hh", Length::Char}, {"ll", Length::LongLong}, {"h", Length::Short}, {"l", Length::Long},
      {"j", Length::IntMax}, {"z", Length::Size},     {"t", Length::PtrDiff}, {"L", Length::LongDouble}};
  for (const auto& l : kLengths) {
    std::size_t n = std::strlen(l.text);
    if (std::strncmp(p, l.text, n) == 0) {
      conv.length = l.length;
      p += n;
      break;
    }
  }
  conv.conversion = *p ? *p++ : 0;
  return p;
}

std::string ConversionFormat(const Conversion& conv, bool withWidth) {
  std::string f = "%" + conv.flags;
  if (withWidth && conv.width >= 0) f += std::to_string(conv.width);
  if (conv.precision >= 0) f += "." + std::to_string(conv.precision);
  static const char* const kLengthText[] = {"", "hh", "h", "l", "ll", "j", "z", "t", "L"};
  f += kLengthText[static_cast<int>(conv.length)];
  f += conv.conversion;
  return f;
}

template <typename T>
std::string Snprintf(const std::string& format, T value) {
  char small[128];
  int n = std::snprintf(small, sizeof small, format.c_str(), value);
  if (n < 0) return {};
  if (static_cast<std::size_t>(n) < sizeof small) return std::string(small, static_cast<std::size_t>(n));
  std::string big(static_cast<std::size_t>(n) + 1, '\0');
  std::snprintf(big.data(), big.size(), format.c_str(), value);
  big.resize(static_cast<std::size_t>(n));
  return big;
}

std::string FormatInteger(const Conversion& conv, va_list& args) {
  const std::string f = ConversionFormat(conv, true);
  const bool isSigned = conv.conversion == 'd' || conv.conversion == 'i';
  switch (conv.length) {
    case Length::Long: return isSigned ? Snprintf(f, va_arg(args, long)) : Snprintf(f, va_arg(args, unsigned long));
    case Length::LongLong:
      return isSigned ? Snprintf(f, va_arg(args, long long)) : Snprintf(f, va_arg(args, unsigned long long));
    case Length::IntMax:
      return isSigned ? Snprintf(f, va_arg(args, std::intmax_t)) : Snprintf(f, va_arg(args, std::uintmax_t));
    case Length::Size: return Snprintf(f, va_arg(args, std::size_t));
    case Length::PtrDiff: return Snprintf(f, va_arg(args, std::ptrdiff_t));
    default: return isSigned ? Snprintf(f, va_arg(args, int)) : Snprintf(f, va_arg(args, unsigned int));
  }
}

// The exponent of an %E conversion gets at least three digits; width is applied afterwards
// so that the longer exponent does not break the requested field width.
std::string FormatExponent(const Conversion& conv, va_list& args) {
  const std::string f = ConversionFormat(conv, false);
  std::string text = conv.length == Length::LongDouble ? Snprintf(f, va_arg(args, long double))
                                                       : Snprintf(f, va_arg(args, double));
  auto e = text.find_first_of("eE");
  if (e != std::string::npos && e + 2 < text.size()) {
    std::size_t digits = text.size() - (e + 2);
    if (digits < 3) text.insert(e + 2, 3 - digits, '0');
  }
  if (conv.width > 0 && text.size() < static_cast<std::size_t>(conv.width)) {
    std::size_t pad = static_cast<std::size_t>(conv.width) - text.size();
    const bool finite = e != std::string::npos;
    if (conv.flags.find('-') != std::string::npos) {
      text.append(pad, ' ');
    } else if (conv.flags.find('0') != std::string::npos && finite) {
      std::size_t at = (text[0] == '-' || text[0] == '+' || text[0] == ' ') ? 1 : 0;
      text.insert(at, pad, '0');
    } else {
      text.insert(0, pad, ' ');
    }
  }
  return text;
}

std::string FormatOne(const Conversion& conv, va_list& args) {
  const std::string f = ConversionFormat(conv, true);
  switch (conv.conversion) {
    case 'd': case 'i': case 'u': case 'o': case 'x': case 'X': return FormatInteger(conv, args);
    case 'e': case 'E': return FormatExponent(conv, args);
    case 'f': case 'F': case 'g': case 'G': case 'a': case 'A':
      return conv.length == Length::LongDouble ? Snprintf(f, va_arg(args, long double))
                                               : Snprintf(f, va_arg(args, double));
    case 'c': return Snprintf(f, va_arg(args, int));
    case 's': {
      const char* s = va_arg(args, const char*);
      return Snprintf(f, s ? s : "(null)");
    }
    case 'p': return Snprintf(f, va_arg(args, void*));
    case '%': return "%";
    default: return {};  // %n and unknown conversions write nothing
  }
}

}  // namespace

Dstring& Dstring::VPrintf(const char* format, va_list args) {
  va_list ap;
  va_copy(ap, args);
  std::string out;
  for (const char* p = format; *p;) {
    const char* pct = std::strchr(p, '%');
    if (!pct) {
      out.append(p);
      break;
    }
    out.append(p, pct);
    Conversion conv;
    p = ParseConversion(pct + 1, conv, ap);
    out += FormatOne(conv, ap);
  }
  va_end(ap);
  assign(std::move(out));
  return *this;
}

Dstring& Dstring::Printf(const char* format, ...) {
  va_list args;
  va_start(args, format);
  VPrintf(format, args);
  va_end(args);
  return *this;
}

Dstring& Dstring::AppendPrintf(const char* format, ...) {
  va_list args;
  va_start(args, format);
  Dstring more;
  more.VPrintf(format, args);
  va_end(args);
  append(more);
  return *this;
}

Dstring Dstring::Format(const char* format, ...) {
  va_list args;
  va_start(args, format);
  Dstring out;
  out.VPrintf(format, args);
  va_end(args);
  return out;
}

Dstring Dstring::ToUpper() const {
  Dstring out(*this);
  for (auto& c : out) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
  return out;
}

Dstring Dstring::Trimmed() const {
  Dstring copy(*this);
  copy.Trim();
  return copy;
}

void Dstring::Trim() {
  const char* blanks = " \t\r\n";
  const auto first = find_first_not_of(blanks);
  if (first == npos) {
    clear();
    return;
  }
  erase(find_last_not_of(blanks) + 1);
  erase(0, first);
}

namespace {

template <typename T, typename F>
bool ReadWhole(const Dstring& text, T& out, F convert) {
  Dstring t = text.Trimmed();
  if (t.empty()) return false;
  char* end = nullptr;
  errno = 0;
  T value = convert(t.c_str(), &end);
  if (errno != 0 || end != t.c_str() + t.size()) return false;
  out = value;
  return true;
}

}  // namespace

bool Dstring::ToLong(long& out) const {
  return ReadWhole(*this, out, [](const char* s, char** e) { return std::strtol(s, e, 10); });
}

bool Dstring::ToULong(unsigned long& out) const {
  if (Trimmed().StartsWith("-")) return false;
  return ReadWhole(*this, out, [](const char* s, char** e) { return std::strtoul(s, e, 10); });
}

bool Dstring::ToDouble(double& out) const {
  return ReadWhole(*this, out, [](const char* s, char** e) { return std::strtod(s, e); });
}
