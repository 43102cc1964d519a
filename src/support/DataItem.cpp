#include "support/DataItem.h"

#include <cassert>
#include <charconv>
#include <cmath>
#include <cstring>
#include <limits>
#include <new>
#include <utility>

namespace {

bool IsDigit(char c) {
  return c >= '0' && c <= '9';
}

std::size_t CountDigits(std::string_view t, std::size_t from) {
  std::size_t i = from;
  while (i < t.size() && IsDigit(t[i])) ++i;
  return i - from;
}

// The number form: [+-] digits [. digits] [e [+-] digits] [i|u|f|d], with at least one
// mantissa digit; i and u only on integers. On success `body` is the token without its suffix.
bool ScanNumber(std::string_view token, std::string_view& body, char& suffix, bool& integral) {
  suffix = 0;
  const char last = token.empty() ? '\0' : token.back();
  if (last == 'i' || last == 'u' || last == 'f' || last == 'd') {
    suffix = token.back();
    token.remove_suffix(1);
  }
  std::size_t i = (!token.empty() && (token[0] == '+' || token[0] == '-')) ? 1 : 0;
  std::size_t mantissa = CountDigits(token, i);
  i += mantissa;
  integral = true;
  if (i < token.size() && token[i] == '.') {
    integral = false;
    std::size_t fraction = CountDigits(token, ++i);
    mantissa += fraction;
    i += fraction;
  }
  if (mantissa == 0) return false;
  if (i < token.size() && (token[i] == 'e' || token[i] == 'E')) {
    integral = false;
    if (++i < token.size() && (token[i] == '+' || token[i] == '-')) ++i;
    std::size_t exponent = CountDigits(token, i);
    if (exponent == 0) return false;
    i += exponent;
  }
  body = token;
  return i == token.size() && (integral || (suffix != 'i' && suffix != 'u'));
}

// Most numbers of a reply are short integers without a suffix ("0", "-12", "1024"): read while
// they are scanned. Up to 18 digits cannot overflow; longer ones take the general way.
bool ShortInteger(std::string_view token, long long& value) {
  const bool negative = !token.empty() && token[0] == '-';
  std::size_t i = !token.empty() && (negative || token[0] == '+') ? 1 : 0;
  if (i == token.size() || token.size() - i > 18) return false;
  long long v = 0;
  for (; i < token.size(); ++i) {
    if (!IsDigit(token[i])) return false;
    v = v * 10 + (token[i] - '0');
  }
  value = negative ? -v : v;
  return true;
}

// from_chars takes no leading '+'.
std::string_view WithoutPlus(std::string_view body) {
  return body[0] == '+' ? body.substr(1) : body;
}

template <typename T>
bool ReadValue(std::string_view body, T& value) {
  body = WithoutPlus(body);
  auto result = std::from_chars(body.data(), body.data() + body.size(), value);
  return result.ec == std::errc() && result.ptr == body.data() + body.size();
}

// A number read from a token, before it becomes an item.
struct Number {
  DataItemType type = DataItemType::Signed;
  long long s = 0;
  unsigned long long u = 0;
  double d = 0;
};

bool ReadSigned(std::string_view body, Number& out) {
  out.type = DataItemType::Signed;
  return ReadValue(body, out.s);
}

bool ReadUnsigned(std::string_view body, Number& out) {
  bool negative = body[0] == '-';
  out.type = DataItemType::Unsigned;
  return ReadValue(negative ? body.substr(1) : body, out.u) && !(negative && out.u != 0);
}

// Overflow and underflow alike are refused: the value would not read back as written.
bool ReadDouble(std::string_view body, Number& out) {
  out.type = DataItemType::Double;
  return ReadValue(body, out.d);
}

bool ReadFloat(std::string_view body, Number& out) {
  float v = 0;
  out.type = DataItemType::Float;
  if (!ReadValue(body, v)) return false;
  out.d = v;
  return true;
}

// Without a suffix: Signed, else Unsigned, else (too large for both) Double.
bool ReadInteger(std::string_view body, Number& out) {
  return ReadSigned(body, out) || (body[0] != '-' && ReadUnsigned(body, out)) || ReadDouble(body, out);
}

bool ReadNumber(std::string_view body, char suffix, bool integral, Number& out) {
  switch (suffix) {
    case 'i':
      return ReadSigned(body, out);
    case 'u':
      return ReadUnsigned(body, out);
    case 'f':
      return ReadFloat(body, out);
    case 'd':
      return ReadDouble(body, out);
    default:
      return integral ? ReadInteger(body, out) : ReadDouble(body, out);
  }
}

// The shortest text that reads back to the same value, with the suffix naming its type.
// Infinities and NaN have no number form; they are written as the instrument's words.
template <typename T>
std::string NumberText(T v, char suffix) {
  if (std::isnan(v)) return "NAN";
  if (std::isinf(v)) return v < 0 ? "-INF" : "INF";
  char buffer[64];
  auto result = std::to_chars(buffer, buffer + sizeof buffer, v);
  std::string text(buffer, result.ptr);
  text += suffix;
  return text;
}

// True when v is integral and within [-2^bits, 2^bits) (or [0, 2^bits) when unsigned).
template <typename T>
bool FitsIntegral(double v) {
  double limit = std::ldexp(1.0, std::numeric_limits<T>::digits);
  double low = std::numeric_limits<T>::is_signed ? -limit : 0.0;
  return v >= low && v < limit && std::trunc(v) == v;
}

// Copies n <= DataItem::kInlineSize bytes with a few fixed-size moves, overlapping where n is
// not a multiple, instead of a library call: the texts of a reply are mostly a few bytes long.
void CopyShort(char* to, const char* from, std::size_t n) {
  if (n >= 8) {
    for (std::size_t i = 0; i + 8 < n; i += 8) std::memcpy(to + i, from + i, 8);
    std::memcpy(to + n - 8, from + n - 8, 8);
  } else if (n >= 4) {
    std::memcpy(to, from, 4);
    std::memcpy(to + n - 4, from + n - 4, 4);
  } else if (n > 0) {
    to[0] = from[0];
    to[n / 2] = from[n / 2];
    to[n - 1] = from[n - 1];
  }
}

std::string Quoted(std::string_view text, char quote) {
  std::string out(1, quote);
  for (char c : text) {
    if (c == quote) out += quote;
    out += c;
  }
  out += quote;
  return out;
}

std::string BlockText(std::string_view bytes) {
  std::string length = std::to_string(bytes.size());
  std::string out(1, '#');
  out += std::to_string(length.size());
  out += length;
  out += bytes;
  return out;
}

}  // namespace

DataItem& DataItem::operator=(const DataItem& other) {
  if (this == &other) return *this;
  ReleaseText();
  mType = other.mType;
  mQuote = other.mQuote;
  mUnsigned = other.mUnsigned;
  CopyTextFrom(other);
  return *this;
}

DataItem& DataItem::operator=(DataItem&& other) noexcept {
  if (this == &other) return *this;
  ReleaseText();
  mType = other.mType;
  mQuote = other.mQuote;
  mUnsigned = other.mUnsigned;
  MoveTextFrom(other);
  return *this;
}

void DataItem::ReleaseText() {
  if (!mInline) mShared.~Shared();
  mInline = true;
  mSize = 0;
}

void DataItem::CopySharedFrom(const DataItem& other) {
  new (&mShared) Shared(other.mShared);
}

void DataItem::MoveSharedFrom(DataItem& other) noexcept {
  new (&mShared) Shared(std::move(other.mShared));
  other.ReleaseText();
}

void DataItem::SetText(std::string_view text) {
  if (text.size() > kInlineSize) {
    auto owner = std::make_shared<const std::string>(text);
    const std::string_view copy = *owner;
    SetShared(copy, std::move(owner));
    return;
  }
  SetInPlace(text);
}

void DataItem::SetInPlace(std::string_view text) {
  if (!mInline) ReleaseText();
  CopyShort(mChars, text.data(), text.size());
  mSize = static_cast<std::uint32_t>(text.size());
}

void DataItem::SetShared(std::string_view text, std::shared_ptr<const std::string> owner) {
  assert(text.size() <= std::numeric_limits<std::uint32_t>::max());
  ReleaseText();
  new (&mShared) Shared{text.data(), std::move(owner)};
  mInline = false;
  mSize = static_cast<std::uint32_t>(text.size());
}

DataItem DataItem::MakeSigned(long long v) {
  DataItem item;
  item.mType = DataItemType::Signed;
  item.mSigned = v;
  item.SetText(std::to_string(v));
  return item;
}

DataItem DataItem::MakeUnsigned(unsigned long long v) {
  DataItem item;
  item.mType = DataItemType::Unsigned;
  item.mUnsigned = v;
  item.SetText(std::to_string(v) + "u");
  return item;
}

DataItem DataItem::MakeFloat(float v) {
  DataItem item;
  item.mType = DataItemType::Float;
  item.mDouble = v;
  item.SetText(NumberText(v, 'f'));
  return item;
}

DataItem DataItem::MakeDouble(double v) {
  DataItem item;
  item.mType = DataItemType::Double;
  item.mDouble = v;
  item.SetText(NumberText(v, 'd'));
  return item;
}

DataItem DataItem::MakeString(std::string_view text, char quote) {
  DataItem item;
  item.mType = DataItemType::String;
  item.mQuote = quote == '\'' ? '\'' : '"';
  item.SetText(text);
  return item;
}

DataItem DataItem::MakeWord(std::string_view text) {
  DataItem item;
  item.SetText(text);
  return item;
}

DataItem DataItem::MakeBlock(std::string_view bytes, std::shared_ptr<const std::string> owner) {
  DataItem item;
  item.mType = DataItemType::Block;
  item.SetShared(bytes, std::move(owner));
  return item;
}

void DataItem::FromString(std::string_view text, char quote, DataItem& out,
                          const std::shared_ptr<const std::string>& owner) {
  out.mType = DataItemType::String;
  out.mQuote = quote == '\'' ? '\'' : '"';
  out.SetTokenText(text, owner);
}

void DataItem::SetTokenText(std::string_view text, const std::shared_ptr<const std::string>& owner) {
  if (text.size() <= kInlineSize) {
    SetInPlace(text);
  } else if (owner) {
    SetShared(text, owner);
  } else {
    SetText(text);
  }
}

bool DataItem::FromToken(std::string_view token, DataItem& out) {
  return FromToken(token, out, nullptr);
}

bool DataItem::FromToken(std::string_view token, DataItem& out, const std::shared_ptr<const std::string>& owner) {
  std::string_view body;
  char suffix = 0;
  bool integral = true;
  Number number;
  if (ShortInteger(token, number.s)) {
    number.type = DataItemType::Signed;
  } else if (!ScanNumber(token, body, suffix, integral)) {
    number.type = DataItemType::Word;
  } else if (!ReadNumber(body, suffix, integral, number)) {
    return false;
  }
  // Written into `out` field by field: the parser builds every item in place this way.
  out.mType = number.type;
  out.mQuote = '"';
  if (number.type == DataItemType::Unsigned) {
    out.mUnsigned = number.u;
  } else if (number.type == DataItemType::Float || number.type == DataItemType::Double) {
    out.mDouble = number.d;
  } else {
    out.mSigned = number.s;
  }
  out.SetTokenText(token, owner);
  return true;
}

bool DataItem::IsNumber() const {
  return IsInteger() || mType == DataItemType::Float || mType == DataItemType::Double;
}

bool DataItem::GetLong(long& out) const {
  switch (mType) {
    case DataItemType::Signed:
      if (!std::in_range<long>(mSigned)) return false;
      out = static_cast<long>(mSigned);
      return true;
    case DataItemType::Unsigned:
      if (!std::in_range<long>(mUnsigned)) return false;
      out = static_cast<long>(mUnsigned);
      return true;
    case DataItemType::Float:
    case DataItemType::Double:
      if (!FitsIntegral<long>(mDouble)) return false;
      out = static_cast<long>(mDouble);
      return true;
    default:
      return false;
  }
}

bool DataItem::GetULong(unsigned long& out) const {
  switch (mType) {
    case DataItemType::Signed:
      if (!std::in_range<unsigned long>(mSigned)) return false;
      out = static_cast<unsigned long>(mSigned);
      return true;
    case DataItemType::Unsigned:
      if (!std::in_range<unsigned long>(mUnsigned)) return false;
      out = static_cast<unsigned long>(mUnsigned);
      return true;
    case DataItemType::Float:
    case DataItemType::Double:
      if (!FitsIntegral<unsigned long>(mDouble)) return false;
      out = static_cast<unsigned long>(mDouble);
      return true;
    default:
      return false;
  }
}

bool DataItem::GetDouble(double& out) const {
  switch (mType) {
    case DataItemType::Signed:
      out = static_cast<double>(mSigned);
      return true;
    case DataItemType::Unsigned:
      out = static_cast<double>(mUnsigned);
      return true;
    case DataItemType::Float:
    case DataItemType::Double:
      out = mDouble;
      return true;
    default:
      return false;
  }
}

bool DataItem::GetFloat(float& out) const {
  double v = 0;
  if (!GetDouble(v)) return false;
  // A finite double beyond the float range does not fit; precision may be lost.
  if (std::isfinite(v) && std::fabs(v) > std::numeric_limits<float>::max()) return false;
  out = static_cast<float>(v);
  return true;
}

std::string_view DataItem::GetText() const {
  return {mInline ? mChars : mShared.data, mSize};
}

Dstring DataItem::AsExpression() const {
  switch (mType) {
    case DataItemType::String:
      return Quoted(GetText(), mQuote);
    case DataItemType::Block:
      return BlockText(GetText());
    default:
      return GetText();
  }
}

bool DataItem::operator==(const DataItem& other) const {
  if (mType != other.mType) return false;
  switch (mType) {
    case DataItemType::Signed:
      return mSigned == other.mSigned;
    case DataItemType::Unsigned:
      return mUnsigned == other.mUnsigned;
    case DataItemType::Float:
    case DataItemType::Double:
      return mDouble == other.mDouble || (std::isnan(mDouble) && std::isnan(other.mDouble));
    case DataItemType::String:
      return mQuote == other.mQuote && GetText() == other.GetText();
    case DataItemType::Word:
    case DataItemType::Block:
      return GetText() == other.GetText();
  }
  return false;
}
