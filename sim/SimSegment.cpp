#include "SimSegment.h"

#include <algorithm>
#include <climits>
#include <cstdlib>
#include <utility>
#include <vector>

#include "SimReply.h"
#include "support/ConditionList.h"
#include "support/DstringList.h"
#include "support/LispList.h"
#include "support/ParserExpression.h"

namespace {

// State order is state-number order: "LHXZ01" stores L as 0 and 1 as 5.
constexpr const char* kCodings[] = {"01", "LH", "01X", "LHX", "LHXZ01", "npkr", "npkrX"};
constexpr const char* kTypes[] = {"MEM", "PRBS", "PRWS", "SFI5"};

struct Partner {
  char a;
  char b;
};
constexpr Partner kPartners[] = {{'0', '1'}, {'l', 'h'}, {'L', 'H'}};

constexpr long kMaxExtension = 1L << 20;
constexpr std::size_t kMaxHeaderDigits = 64;
constexpr const char* kDigits = "0123456789abcdef";

enum class ParamKind { Text, Word, Count, Rotation };

struct ParamRule {
  const char* name;
  ParamKind kind;
  const char* words;  // the allowed words or texts, '|'-separated; null for any
  long max;
};

constexpr ParamRule kParamRules[] = {
    {"_Polynom", ParamKind::Text, nullptr, 0},
    {"_Logic", ParamKind::Word, "NORMAL|INVERTED", 0},
    {"_PRxSType", ParamKind::Word, "PURE|ERRORED|DENSITY|EXTENDED", 0},
    {"_Which", ParamKind::Word, "ZERO|ONE", 0},
    {"_Errors", ParamKind::Count, nullptr, INT_MAX},
    {"_Density", ParamKind::Text, "1/8|1/4|1/2|3/4|7/8", 0},
    {"_Number", ParamKind::Count, nullptr, kMaxExtension},
    {"_Rotating", ParamKind::Rotation, nullptr, INT_MAX},
    {"_Base", ParamKind::Text, "2|4|8|16", 0},
    {"_ExpansionHeader", ParamKind::Text, nullptr, 0},
    {"_FramingBytes", ParamKind::Text, nullptr, 0},
};

const ParamRule* FindRule(const Dstring& name) {
  for (const ParamRule& r : kParamRules) {
    if (name == r.name) return &r;
  }
  return nullptr;
}

bool IsOneOf(const char* words, const Dstring& word) {
  return DstringList::Split(words, '|').Contains(word);
}

bool IsType(const Dstring& type) {
  return std::any_of(std::begin(kTypes), std::end(kTypes), [&](const char* t) { return type == t; });
}

// The one value inside a parameter list, as the client wrote it: ("x"), (WORD), (12), ().
bool ParamItems(const Dstring& value, LispList& items) {
  ConditionList ignored;
  return ParserExpression::Parse(value, items, ignored) == 0 && items.Size() <= 1 &&
         (items.Size() == 0 || items[0].IsItem());
}

// The digits of `text` in `base` (2, 4, 8, 16) as '0'/'1' text; false on a foreign digit.
bool DigitsToBits(const Dstring& text, long base, Dstring& bits) {
  const int per = base == 2 ? 1 : base == 4 ? 2 : base == 8 ? 3 : 4;
  bits.clear();
  for (char c : text) {
    const char lower = static_cast<char>(c >= 'A' && c <= 'F' ? c - 'A' + 'a' : c);
    const std::size_t value = Dstring(kDigits).find(lower);
    if (value == Dstring::npos || static_cast<long>(value) >= base) return false;
    for (int b = per - 1; b >= 0; --b) bits += ((value >> b) & 1u) ? '1' : '0';
  }
  return true;
}

Dstring TextOf(const Dstring& stored) {
  LispList items;
  return ParamItems(stored, items) && items.Size() == 1 ? Dstring(items[0].GetItem().GetText()) : Dstring();
}

long NumberOf(const Dstring& stored) {
  long n = 0;
  LispList items;
  if (ParamItems(stored, items) && items.Size() == 1) items[0].GetItem().GetLong(n);
  return n;
}

bool FitsMemory(long width, long length, int stateWidth) {
  return static_cast<long long>(width) * length * stateWidth <= SimSegment::kMaxBits;
}

// The stored form of a parameter value, or the SCPI error.
int StoredValue(const ParamRule& rule, const LispList& items, Dstring& stored) {
  if (rule.kind == ParamKind::Rotation && items.Size() == 0) {
    stored = "(0)";
    return 0;
  }
  if (items.Size() != 1) return -109;
  const DataItem& item = items[0].GetItem();
  if (rule.kind == ParamKind::Count || rule.kind == ParamKind::Rotation) {
    long n = 0;
    if (!item.IsInteger() || !item.GetLong(n)) return -104;
    if (n < 0 || n > rule.max) return -222;
    stored = Dstring::Format("(%ld)", n);
    return 0;
  }
  if ((rule.kind == ParamKind::Text) != (item.GetType() == DataItemType::String)) return -104;
  const Dstring text =
      rule.kind == ParamKind::Word ? Dstring(item.GetText()).ToUpper() : Dstring(item.GetText());
  if (rule.words != nullptr && !IsOneOf(rule.words, text)) return -224;
  if (text.size() > kMaxHeaderDigits) return -222;
  stored = rule.kind == ParamKind::Word ? "(" + text + ")" : "(" + item.AsExpression() + ")";
  return 0;
}

}  // namespace

bool SimSegment::IsKnownCoding(const Dstring& coding) {
  return std::any_of(std::begin(kCodings), std::end(kCodings), [&](const char* c) { return coding == c; });
}

int SimSegment::StateWidthOf(const Dstring& coding) {
  int bits = 0;
  while ((1u << bits) < coding.size()) ++bits;
  return bits;
}

std::map<Dstring, Dstring> SimSegment::DefaultParams() {
  return {{"_Polynom", "(\"2^7-1\")"},
          {"_Logic", "(NORMAL)"},
          {"_PRxSType", "(PURE)"},
          {"_Which", "(ZERO)"},
          {"_Errors", "(0)"},
          {"_Density", "(\"1/2\")"},
          {"_Number", "(0)"},
          {"_Rotating", "(0)"},
          {"_Base", "(\"16\")"},
          {"_ExpansionHeader", "(\"00\")"},
          {"_FramingBytes", "(\"f628\")"}};
}

long SimSegment::GetWidth() const {
  return IsGenerated() ? mGeneratedWidth : mRows.GetWidth();
}
long SimSegment::GetLength() const {
  return IsGenerated() ? mGenerator.GetLength() : mRows.GetLength();
}

char SimSegment::StateAt(long trace, long vector) const {
  if (!IsGenerated()) {
    const unsigned n = mRows.Get(trace, vector);
    return n < mCoding.size() ? mCoding[n] : '?';
  }
  std::vector<std::uint8_t> bit;
  const long index = mType == "PRWS" ? vector * mGeneratedWidth + trace : vector;
  mGenerator.Bits(index, 1, bit);
  return static_cast<char>('0' + bit[0]);
}

int SimSegment::CheckRange(long t0, long v0, long t1, long v1) const {
  const bool inside = 0 <= t0 && t0 <= t1 && t1 < GetWidth() && 0 <= v0 && v0 <= v1 && v1 < GetLength();
  return inside ? 0 : -222;
}

// Generated data are not edited; they change through their parameters.
int SimSegment::CheckMemory() const {
  return IsGenerated() ? -200 : 0;
}

bool SimSegment::Configure(const std::map<Dstring, Dstring>& params, SimSegmentGenerator& generator) const {
  SimSegmentGenerator::Settings s;
  s.polynomial = TextOf(params.at("_Polynom"));
  s.inverted = TextOf(params.at("_Logic")) == "INVERTED";
  s.kind = TextOf(params.at("_PRxSType"));
  s.extendOnes = TextOf(params.at("_Which")) == "ONE";
  s.errors = NumberOf(params.at("_Errors"));
  s.density = TextOf(params.at("_Density"));
  s.number = NumberOf(params.at("_Number"));
  s.rotation = NumberOf(params.at("_Rotating"));
  s.framed = mType == "SFI5";
  const long base = std::atol(TextOf(params.at("_Base")).c_str());
  const bool digits = DigitsToBits(TextOf(params.at("_FramingBytes")), base, s.framingBits) &&
                      DigitsToBits(TextOf(params.at("_ExpansionHeader")), base, s.headerBits);
  return digits && generator.Configure(s);
}

// A header not written in the new base is cleared; the client writes the headers after the base.
void SimSegment::ClearForeignHeaders(std::map<Dstring, Dstring>& params) {
  const long base = std::atol(TextOf(params.at("_Base")).c_str());
  Dstring bits;
  for (const char* name : {"_ExpansionHeader", "_FramingBytes"}) {
    if (!DigitsToBits(TextOf(params.at(name)), base, bits)) params[name] = "(\"\")";
  }
}

// Block by block, so that generated data are worked out a run at a time, not state by state.
int SimSegment::CopyRows(long t0, long v0, long t1, long v1, SimSegmentRows& rows) const {
  const int stateWidth = StateWidthOf(mCoding);
  if (!FitsMemory(t1 - t0 + 1, v1 - v0 + 1, stateWidth)) return -222;
  rows = SimSegmentRows(t1 - t0 + 1, v1 - v0 + 1, stateWidth);
  const long chunk = std::max(8L, kMaxBlockBytes * 8 / stateWidth / (t1 - t0 + 1) / 8 * 8);
  for (long from = v0; from <= v1; from += chunk) {
    const long to = std::min(v1, from + chunk - 1);
    std::string block;
    if (int rc = ReadBlock(t0, from, t1, to, block)) return rc;
    rows.WriteBlock(0, from - v0, t1 - t0, to - v0, block);
  }
  return 0;
}

int SimSegment::Materialise(SimSegmentRows& rows) const {
  if (GetWidth() == 0 || GetLength() == 0) {
    rows = SimSegmentRows(GetWidth(), GetLength(), 1);
    return 0;
  }
  return CopyRows(0, 0, GetWidth() - 1, GetLength() - 1, rows);
}

// Generated data become memory data as they are; memory data make way for the stream.
int SimSegment::SetType(const Dstring& type) {
  if (!IsType(type)) return -224;
  if (type == mType) return 0;
  if (type == "MEM") {
    SimSegmentRows rows;
    if (int rc = Materialise(rows)) return rc;
    mRows = std::move(rows);
    mType = type;
    return 0;
  }
  const Dstring old = std::exchange(mType, type);
  SimSegmentGenerator generator;
  if (!Configure(mParams, generator)) {
    mType = old;
    return -222;
  }
  if (old == "MEM") mGeneratedWidth = std::max(1L, mRows.GetWidth());
  mGenerator = generator;
  mRows = SimSegmentRows();
  mCoding = "01";
  return 0;
}

// A new coding starts the contents afresh (every state the coding's first); Convert keeps them.
int SimSegment::SetCoding(const Dstring& coding) {
  if (!IsKnownCoding(coding)) return -224;
  if (coding == mCoding) return 0;
  if (IsGenerated()) return -200;
  const int stateWidth = StateWidthOf(coding);
  if (!FitsMemory(mRows.GetWidth(), mRows.GetLength(), stateWidth)) return -222;
  mRows = SimSegmentRows(mRows.GetWidth(), mRows.GetLength(), stateWidth);
  mCoding = coding;
  return 0;
}

// A state keeps its character when the new coding has it, else takes the character at its
// place in the new coding.
int SimSegment::Convert(const Dstring& from, const Dstring& to) {
  if (int rc = CheckMemory()) return rc;
  if (from != mCoding || !IsKnownCoding(to)) return -224;
  std::vector<unsigned> map;
  for (std::size_t i = 0; i < from.size(); ++i) {
    std::size_t at = to.find(from[i]);
    if (at == Dstring::npos) at = i;
    if (at >= to.size()) return -224;
    map.push_back(static_cast<unsigned>(at));
  }
  const int stateWidth = StateWidthOf(to);
  if (!FitsMemory(mRows.GetWidth(), mRows.GetLength(), stateWidth)) return -222;
  SimSegmentRows rows(mRows.GetWidth(), mRows.GetLength(), stateWidth);
  for (long t = 0; t < rows.GetWidth(); ++t) {
    for (long v = 0; v < rows.GetLength(); ++v) {
      rows.Set(t, v, map[std::min<std::size_t>(mRows.Get(t, v), map.size() - 1)]);
    }
  }
  mRows = std::move(rows);
  mCoding = to;
  return 0;
}

int SimSegment::ReadBlock(long t0, long v0, long t1, long v1, std::string& out, bool header) const {
  if (int rc = CheckRange(t0, v0, t1, v1)) return rc;
  const int stateWidth = IsGenerated() ? 1 : mRows.GetStateWidth();
  const std::size_t rowBytes = SimSegmentRows::RowBytes(v1 - v0 + 1, stateWidth);
  if (static_cast<long>(rowBytes) * (t1 - t0 + 1) > kMaxBlockBytes) return -222;
  if (header) out += SimBlockHeader(rowBytes * static_cast<std::size_t>(t1 - t0 + 1));
  if (!IsGenerated()) {
    mRows.ReadBlock(t0, v0, t1, v1, out);
    return 0;
  }
  // Generated: one run of the stream serves every trace, except that a word stream gives each
  // trace its own bit of the word.
  const long vectors = v1 - v0 + 1;
  const bool words = mType == "PRWS";
  const long stride = words ? mGeneratedWidth : 1;
  std::vector<std::uint8_t> bits;
  mGenerator.Bits(v0 * stride, vectors * stride, bits);
  SimSegmentRows rows(t1 - t0 + 1, vectors, 1);
  for (long t = t0; t <= t1; ++t) {
    for (long v = 0; v < vectors; ++v)
      rows.Set(t - t0, v, bits[static_cast<std::size_t>(v * stride + (words ? t : 0))]);
  }
  rows.ReadBlock(0, 0, t1 - t0, vectors - 1, out);
  return 0;
}

int SimSegment::WriteBlock(long t0, long v0, long t1, long v1, std::string_view block) {
  if (int rc = CheckMemory()) return rc;
  if (int rc = CheckRange(t0, v0, t1, v1)) return rc;
  const int stateWidth = mRows.GetStateWidth();
  const std::size_t rowBytes = SimSegmentRows::RowBytes(v1 - v0 + 1, stateWidth);
  if (static_cast<long>(rowBytes) * (t1 - t0 + 1) > kMaxBlockBytes) return -222;
  if (block.size() != rowBytes * static_cast<std::size_t>(t1 - t0 + 1)) return -104;
  const auto limit = static_cast<unsigned>(mCoding.size());
  if (!SimSegmentRows::BlockBelow(block, t1 - t0 + 1, v1 - v0 + 1, stateWidth, limit)) return -222;
  mRows.WriteBlock(t0, v0, t1, v1, block);
  return 0;
}

int SimSegment::Keep(long t0, long v0, long t1, long v1, std::string& states) const {
  if (int rc = CheckMemory()) return rc;
  if (int rc = CheckRange(t0, v0, t1, v1)) return rc;
  states.clear();
  mRows.ReadBlock(t0, v0, t1, v1, states);
  return 0;
}

void SimSegment::PutBack(long t0, long v0, long t1, long v1, const std::string& states) {
  mRows.WriteBlock(t0, v0, t1, v1, states);
}

int SimSegment::Fill(long t0, long v0, long t1, long v1, long state) {
  if (int rc = CheckMemory()) return rc;
  if (int rc = CheckRange(t0, v0, t1, v1)) return rc;
  if (state < 0 || state >= static_cast<long>(mCoding.size())) return -222;
  for (long t = t0; t <= t1; ++t) mRows.Fill(t, v0, v1 - v0 + 1, static_cast<unsigned>(state));
  return 0;
}

// 0 and 1, l and h, L and H swap where the coding has both; other states stay.
int SimSegment::Invert(long t0, long v0, long t1, long v1) {
  if (int rc = CheckMemory()) return rc;
  if (int rc = CheckRange(t0, v0, t1, v1)) return rc;
  std::vector<unsigned> map;
  for (std::size_t i = 0; i < mCoding.size(); ++i) {
    std::size_t to = i;
    for (const Partner& p : kPartners) {
      const char other = mCoding[i] == p.a ? p.b : mCoding[i] == p.b ? p.a : '\0';
      if (other != '\0' && mCoding.find(other) != Dstring::npos) to = mCoding.find(other);
    }
    map.push_back(static_cast<unsigned>(to));
  }
  // Two one-bit states that swap: the bits of the rows flip a byte at a time.
  if (mRows.GetStateWidth() == 1 && map == std::vector<unsigned>{1, 0}) {
    for (long t = t0; t <= t1; ++t) mRows.FlipBits(t, v0, v1 - v0 + 1);
    return 0;
  }
  for (long t = t0; t <= t1; ++t) {
    for (long v = v0; v <= v1; ++v)
      mRows.Set(t, v, map[std::min<std::size_t>(mRows.Get(t, v), map.size() - 1)]);
  }
  return 0;
}

int SimSegment::Mirror(long t0, long v0, long t1, long v1, bool traces) {
  if (int rc = CheckMemory()) return rc;
  if (int rc = CheckRange(t0, v0, t1, v1)) return rc;
  for (long t = t0; t <= t1; ++t) {
    for (long v = v0; v <= v1; ++v) {
      const long mt = traces ? t1 - (t - t0) : t, mv = traces ? v : v1 - (v - v0);
      // Each pair swaps once, from its first member.
      if (mt < t || (mt == t && mv <= v)) continue;
      const unsigned a = mRows.Get(t, v);
      mRows.Set(t, v, mRows.Get(mt, mv));
      mRows.Set(mt, mv, a);
    }
  }
  return 0;
}

int SimSegment::Copy(long t0, long v0, long t1, long v1, SimSegmentClip& clip) const {
  if (int rc = CheckRange(t0, v0, t1, v1)) return rc;
  SimSegmentRows rows;
  if (int rc = CopyRows(t0, v0, t1, v1, rows)) return rc;
  clip = SimSegmentClip{true, mCoding, std::move(rows)};
  return 0;
}

// Every state of the clipboard must exist in this coding; it lands as the same character.
int SimSegment::Paste(const SimSegmentClip& clip, long trace, long vector) {
  if (int rc = CheckMemory()) return rc;
  if (!clip.filled) return -200;
  const long width = clip.rows.GetWidth(), length = clip.rows.GetLength();
  if (trace < 0 || vector < 0 || trace + width > GetWidth() || vector + length > GetLength()) return -222;
  std::vector<unsigned> map;
  for (char c : clip.coding) {
    const std::size_t at = mCoding.find(c);
    if (at == Dstring::npos) return -224;
    map.push_back(static_cast<unsigned>(at));
  }
  for (long t = 0; t < width; ++t) {
    for (long v = 0; v < length; ++v) {
      mRows.Set(trace + t, vector + v, map[std::min<std::size_t>(clip.rows.Get(t, v), map.size() - 1)]);
    }
  }
  return 0;
}

// Before `position` (which may be the size, to append) or after it; new states are the first
// of the coding. A generated segment only takes traces: its word gets wider.
int SimSegment::Insert(long position, bool vectors, bool after, long count) {
  const long size = vectors ? GetLength() : GetWidth();
  const long at = after ? position + 1 : position;
  if (count < 0 || position < 0 || at > size || (after && position >= size)) return -222;
  if (IsGenerated()) {
    if (vectors) return -200;
    if (mGeneratedWidth + count > kMaxWidth) return -222;
    mGeneratedWidth += count;
    return 0;
  }
  const long width = vectors ? mRows.GetWidth() : mRows.GetWidth() + count;
  const long length = vectors ? mRows.GetLength() + count : mRows.GetLength();
  if (width > kMaxWidth || length > INT_MAX || !FitsMemory(width, length, mRows.GetStateWidth())) return -222;
  if (vectors) {
    mRows.InsertVectors(at, count);
  } else {
    mRows.InsertTraces(at, count);
  }
  return 0;
}

int SimSegment::Delete(long position, bool vectors, long count, bool clear) {
  const long size = vectors ? GetLength() : GetWidth();
  if (count < 0 || position < 0 || position + count > size) return -222;
  if (IsGenerated()) {
    if (vectors || clear) return -200;
    mGeneratedWidth -= count;
    return 0;
  }
  if (clear) {
    const long first = vectors ? 0 : position, last = vectors ? GetWidth() : position + count;
    for (long t = first; t < last; ++t)
      mRows.Fill(t, vectors ? position : 0, vectors ? count : GetLength(), 0);
  } else if (vectors) {
    mRows.DeleteVectors(position, count);
  } else {
    mRows.DeleteTraces(position, count);
  }
  return 0;
}

// Each vector's traces go out one after the other, trace 0 first (LSB) or last (MSB).
int SimSegment::Serialize(bool msbFirst) {
  if (int rc = CheckMemory()) return rc;
  const long width = mRows.GetWidth(), length = mRows.GetLength();
  if (static_cast<long long>(width) * length > INT_MAX) return -222;
  SimSegmentRows rows(width > 0 ? 1 : 0, width * length, mRows.GetStateWidth());
  for (long v = 0; v < length; ++v) {
    for (long k = 0; k < width; ++k) rows.Set(0, v * width + k, mRows.Get(msbFirst ? width - 1 - k : k, v));
  }
  mRows = std::move(rows);
  return 0;
}

// A single trace becomes `width` traces: after `offset` states, each run of `width` states is
// one vector, its first state on trace 0. States left over at the end are dropped.
int SimSegment::Deserialize(long width, long offset) {
  if (int rc = CheckMemory()) return rc;
  if (mRows.GetWidth() != 1) return -200;
  if (width < 1 || width > kMaxWidth || offset < 0 || offset > mRows.GetLength()) return -222;
  const long length = (mRows.GetLength() - offset) / width;
  SimSegmentRows rows(width, length, mRows.GetStateWidth());
  for (long v = 0; v < length; ++v) {
    for (long t = 0; t < width; ++t) rows.Set(t, v, mRows.Get(0, offset + v * width + t));
  }
  mRows = std::move(rows);
  return 0;
}

// Every parameter must still make a stream, whatever the type now is.
int SimSegment::SetParam(const Dstring& name, const Dstring& value) {
  const ParamRule* rule = FindRule(name);
  LispList items;
  Dstring stored;
  if (rule == nullptr) return -224;
  if (!ParamItems(value, items)) return -104;
  if (int rc = StoredValue(*rule, items, stored)) return rc;
  std::map<Dstring, Dstring> params = mParams;
  params[name] = stored;
  if (name == "_Base") ClearForeignHeaders(params);
  SimSegmentGenerator generator;
  if (!Configure(params, generator)) return name == "_Errors" || name == "_Number" ? -222 : -224;
  mParams = std::move(params);
  if (IsGenerated()) mGenerator = generator;
  return 0;
}

int SimSegment::GetParam(const Dstring& name, Dstring& value) const {
  auto it = mParams.find(name);
  if (it == mParams.end()) return -224;
  value = it->second;
  return 0;
}

int SimSegment::Restore(const Dstring& type, const Dstring& coding, long width,
                        std::map<Dstring, Dstring> params, SimSegmentRows rows) {
  if (!IsType(type) || !IsKnownCoding(coding) || width < 0 || width > kMaxWidth) return -200;
  if (type == "MEM" && (rows.GetStateWidth() != StateWidthOf(coding) || rows.GetWidth() != width))
    return -200;
  SimSegment restored(mName);
  for (const auto& [name, value] : params) {
    if (restored.SetParam(name, value) != 0) return -200;
  }
  restored.mType = type;
  restored.mCoding = coding;
  restored.mRows = std::move(rows);
  restored.mGeneratedWidth = width;
  if (type != "MEM" && !restored.Configure(restored.mParams, restored.mGenerator)) return -200;
  *this = std::move(restored);
  return 0;
}
