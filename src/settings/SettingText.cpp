#include "settings/SettingText.h"

#include <charconv>
#include <map>

#include "support/ConditionList.h"
#include "support/DataParcel.h"
#include "support/LispList.h"
#include "support/ParserExpression.h"

namespace {

constexpr std::string_view kSettingHeader = "qen setting ";
constexpr std::string_view kSequenceHeader = "qen sequence ";
constexpr std::string_view kLegacyHeader = "qensim setting 1";
constexpr std::size_t kShown = 60;

bool IsControl(char c) { return static_cast<unsigned char>(c) < 0x20 || c == 0x7f; }
bool IsBlank(char c) { return c == ' ' || c == '\t'; }
bool IsLetter(char c) { return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z'); }

// A text as a message shows it: cut, and without what would break the message's line.
Dstring Shown(std::string_view text) {
  Dstring out;
  for (char c : text.substr(0, kShown)) out += IsControl(c) ? '?' : c;
  if (text.size() > kShown) out += "...";
  return out;
}

void AppendEscaped(Dstring& out, char c, bool edge) {
  if (IsControl(c) || c == '%' || (edge && c == ' ')) {
    out.AppendPrintf("%%%02X", static_cast<unsigned char>(c));
  } else {
    out += c;
  }
}

// "keyword", or "keyword text" with "%", control characters and blanks at either end written
// as %XX, so that no editor can lose them.
void AppendLine(Dstring& out, std::string_view keyword, std::string_view text) {
  out += keyword;
  if (!text.empty()) out += ' ';
  for (std::size_t i = 0; i < text.size(); ++i) AppendEscaped(out, text[i], i == 0 || i + 1 == text.size());
  out += '\n';
}

// As AppendLine, with the expression cut into lines before each element of its outer list
// and before each list that begins with a word (BLOCK, SEQ, LOOP), each continuation indented
// by its depth: one block, one event, one profile entry a line.
void AppendExpression(Dstring& out, std::string_view keyword, std::string_view text) {
  out += keyword;
  if (!text.empty()) out += ' ';
  int depth = 0;
  char quote = 0;
  for (std::size_t i = 0; i < text.size(); ++i) {
    const char c = text[i];
    if (quote != 0) {
      if (c == quote) quote = 0;  // a doubled quote closes and opens again
    } else if (c == '"' || c == '\'') {
      quote = c;
    } else if (c == '(') {
      const bool item = depth == 1 || (i + 1 < text.size() && IsLetter(text[i + 1]));
      if (depth >= 1 && item && !IsBlank(text[i - 1])) out += "\n" + Dstring(2 * static_cast<std::size_t>(depth), ' ');
      ++depth;
    } else if (c == ')') {
      --depth;
    }
    AppendEscaped(out, c, i == 0 || i + 1 == text.size());
  }
  out += '\n';
}

bool Unescape(std::string_view text, Dstring& out, Dstring& why) {
  out.clear();
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] != '%') {
      out += text[i];
      continue;
    }
    unsigned value = 0;
    const char* digits = text.data() + i + 1;
    if (i + 2 >= text.size() || std::from_chars(digits, digits + 2, value, 16).ptr != digits + 2) {
      why = "\"" + Shown(text.substr(i, 3)) + "\" is no escape: a % is followed by two hexadecimal digits";
      return false;
    }
    out += static_cast<char>(value);
    i += 2;
  }
  return true;
}

bool IsHeader(std::string_view header) {
  if (header.size() < 2 || header[0] != ':' || header.back() == ':') return false;
  for (std::size_t i = 1; i < header.size(); ++i) {
    const char c = header[i];
    const bool plain = IsLetter(c) || (c >= '0' && c <= '9') || c == '_' || c == ':';
    if (!plain || (c == ':' && header[i - 1] == ':')) return false;
  }
  return true;
}

// A value is a number, a word of the instrument or a quoted text: nothing in a bare word that
// would read as more.
bool IsPlainValue(const DataItem& item) {
  if (item.GetType() == DataItemType::String) return true;
  if (item.GetType() == DataItemType::Block) return false;
  for (char c : item.GetText()) {
    if (!IsLetter(c) && !(c >= '0' && c <= '9') && c != '_' && c != '.' && c != '+' && c != '-') return false;
  }
  return !item.GetText().empty();
}

bool IsExpression(std::string_view text) {
  LispList parsed;
  ConditionList ignored;
  return ParserExpression::Parse(text, parsed, ignored) == 0;
}

}  // namespace

// One item: its keyword, its text with continuations joined (still escaped), its first line.
class SettingText::Reader {
 public:
  Reader(SettingText& out, Problem& problem) : mOut(out), mProblem(problem) {}

  bool Header(std::string_view line, Kind kind) {
    const std::string_view expected = kind == Kind::kSetting ? kSettingHeader : kSequenceHeader;
    const std::string_view other = kind == Kind::kSetting ? kSequenceHeader : kSettingHeader;
    if (kind == Kind::kSetting && line == kLegacyHeader) {
      mOut.mLegacy = true;
      return true;
    }
    if (line.starts_with(other)) {
      return Fail(1, kind == Kind::kSetting ? "this is a sequence text, not a setting"
                                            : "this is a setting text, not a sequence");
    }
    int version = 0;
    const std::string_view number = line.substr(std::min(line.size(), expected.size()));
    const auto [end, error] = std::from_chars(number.data(), number.data() + number.size(), version);
    if (!line.starts_with(expected) || number.empty() || error != std::errc() || end != number.data() + number.size()) {
      return Fail(1, Dstring::Format("\"%s\" is not the first line of a %s text, \"%s%d\"", Shown(line).c_str(),
                                     kind == Kind::kSetting ? "setting" : "sequence",
                                     Dstring(expected).c_str(), kVersion));
    }
    if (version != kVersion) {
      return Fail(1, Dstring::Format("the text is of version %d; this program reads version %d", version, kVersion));
    }
    return true;
  }

  // A line of the text after the first; false when it is wrong.
  bool Line(std::string_view line, int number) {
    if (line.empty() || line[0] == '#') return true;
    if (IsBlank(line[0])) {
      if (mKeyword.empty()) return Fail(number, "a line that begins with a blank continues an item, and there is none above");
      const std::size_t start = line.find_first_not_of(" \t");
      if (start != std::string_view::npos) mText += line.substr(start);
      return true;
    }
    if (!Finish()) return false;
    if (mOut.mEndLine != 0) return Fail(number, "nothing but comments may follow the end line");
    const std::size_t blank = line.find(' ');
    mKeyword = line.substr(0, blank);
    mText = blank == std::string_view::npos ? std::string_view() : line.substr(blank + 1);
    mLine = number;
    if (mKeyword == "end") {
      if (!mText.empty()) return Fail(number, "the end line is \"end\" alone");
      mOut.mEndLine = number;
      mKeyword.clear();
    }
    return true;
  }

  bool End(int lines) {
    if (!Finish()) return false;
    if (mOut.mEndLine == 0) return Fail(lines + 1, "the text ends without its end line: it was cut short");
    if (!mOut.mLegacy && !mOut.mHasSequence) return Fail(mOut.mEndLine, "the text has no sequence line");
    return true;
  }

 private:
  bool Fail(int line, const Dstring& what) {
    mProblem = {line, what};
    return false;
  }

  struct Keyword {
    const char* word;
    bool (Reader::*take)(const Dstring& text);
    bool setting;
    bool sequence;
    bool legacy;
  };
  static const Keyword kKeywords[5];

  bool Finish() {
    if (mKeyword.empty()) return true;
    Dstring text, why;
    if (!Unescape(mText, text, why)) return Fail(mLine, why);
    for (const Keyword& k : kKeywords) {
      const bool allowed = mOut.mLegacy ? k.legacy : mOut.mKind == Kind::kSetting ? k.setting : k.sequence;
      if (mKeyword != k.word || !allowed) continue;
      mKeyword.clear();
      return (this->*k.take)(text);
    }
    return Fail(mLine, Dstring::Format("\"%s\" is not a line of a %s text: %s", Shown(mKeyword).c_str(),
                                       mOut.mKind == Kind::kSetting ? "setting" : "sequence",
                                       mOut.mLegacy                     ? "value, profile or end"
                                       : mOut.mKind == Kind::kSetting ? "value, profile, connection, sequence, events or end"
                                                                      : "sequence, events or end"));
  }

  bool TakeValue(const Dstring& text) {
    const std::size_t blank = text.find(' ');
    const Dstring header = text.substr(0, blank);
    const Dstring value = blank == Dstring::npos ? Dstring() : text.substr(blank + 1);
    if (!IsHeader(header)) {
      return Fail(mLine, "\"" + Shown(header) + "\" is no parameter header: a colon, then letters, digits, _ and colons");
    }
    DataParcel items;
    ConditionList ignored;
    if (value.empty() || value[0] == '(' || ParserExpression::Parse(value, items, ignored) != 0 || items.size() != 1 ||
        !IsPlainValue(items[0])) {
      return Fail(mLine, "the value \"" + Shown(value) + "\" of " + header + " is not one number, word or quoted text");
    }
    const auto [seen, fresh] = mHeaders.emplace(header.ToUpper(), mLine);
    if (!fresh) return Fail(mLine, Dstring::Format("%s has a value on line %d already", header.c_str(), seen->second));
    mOut.mValues.push_back({header, value, mLine});
    return true;
  }

  bool TakeProfile(const Dstring& text) {
    if (mProfileLine != 0) return Fail(mLine, Dstring::Format("the setting profile is given on line %d already", mProfileLine));
    if (!IsExpression(text)) return Fail(mLine, "the setting profile \"" + Shown(text) + "\" is not a list expression");
    mProfileLine = mLine;
    mOut.mProfile = text;
    return true;
  }

  bool TakeConnection(const Dstring& text) {
    DataParcel items;
    ConditionList ignored;
    if (ParserExpression::Parse(text, items, ignored) != 0 || items.size() != 2 ||
        items[0].GetType() != DataItemType::String || items[1].GetType() != DataItemType::String) {
      return Fail(mLine, "a connection is two port names in double quotes, the generator port first");
    }
    const Dstring generator(items[0].GetText());
    const Dstring analyser(items[1].GetText());
    const auto [seen, fresh] = mAnalysers.emplace(analyser.ToUpper(), mLine);
    if (!fresh) return Fail(mLine, Dstring::Format("%s is connected on line %d already", analyser.c_str(), seen->second));
    mOut.mConnections.push_back({generator, analyser, mLine});
    return true;
  }

  bool TakeSequence(const Dstring& text) {
    if (mOut.mHasSequence) return Fail(mLine, Dstring::Format("the sequence is given on line %d already", mOut.mSequenceLine));
    LispList parsed;
    ConditionList ignored;
    if (ParserExpression::ParseElements(text, parsed, ignored) != 0 || parsed.Size() != 1 || !parsed[0].IsList() ||
        parsed[0].Size() < 3) {
      return Fail(mLine, "the sequence \"" + Shown(text) + "\" is not a sequence expression (version, label, element)");
    }
    mOut.SetSequence(text);
    mOut.mSequenceLine = mLine;
    return true;
  }

  bool TakeEvents(const Dstring& text) {
    if (mOut.mHasEvents) return Fail(mLine, Dstring::Format("the events are given on line %d already", mOut.mEventsLine));
    if (text.empty() || !IsExpression(text)) return Fail(mLine, "the events \"" + Shown(text) + "\" are not a list expression");
    mOut.SetEvents(text);
    mOut.mEventsLine = mLine;
    return true;
  }

  SettingText& mOut;
  Problem& mProblem;
  Dstring mKeyword;
  Dstring mText;
  int mLine = 0;
  int mProfileLine = 0;
  // Upper-case headers and analyser ports with the line that gave them.
  std::map<Dstring, int> mHeaders;
  std::map<Dstring, int> mAnalysers;
};

const SettingText::Reader::Keyword SettingText::Reader::kKeywords[5] = {
    {"value", &Reader::TakeValue, true, false, true},
    {"profile", &Reader::TakeProfile, true, false, true},
    {"connection", &Reader::TakeConnection, true, false, false},
    {"sequence", &Reader::TakeSequence, true, true, false},
    {"events", &Reader::TakeEvents, true, true, false},
};

void SettingText::SetSequence(const Dstring& sequence) {
  mSequence = sequence;
  mHasSequence = true;
}

void SettingText::SetEvents(const Dstring& events) {
  mEvents = events;
  mHasEvents = true;
}

bool SettingText::Read(std::string_view text, Kind kind, SettingText& out, Problem& problem) {
  SettingText read(kind);
  Reader reader(read, problem);
  int number = 0;
  for (std::size_t start = 0; start < text.size();) {
    std::size_t end = text.find('\n', start);
    if (end == std::string_view::npos) end = text.size();
    std::string_view line = text.substr(start, end - start);
    // A file that passed through another system may end its lines in CR LF; a CR of a value is
    // always written as %0D.
    if (line.ends_with('\r')) line.remove_suffix(1);
    start = end + 1;
    ++number;
    const bool ok = number == 1 ? reader.Header(line, kind) : reader.Line(line, number);
    if (!ok) return false;
  }
  if (number == 0) {
    problem = {1, "the text is empty"};
    return false;
  }
  if (!reader.End(number)) return false;
  out = std::move(read);
  return true;
}

Dstring SettingText::Write() const {
  Dstring out = Dstring::Format("%s%d\n", mKind == Kind::kSetting ? "qen setting " : "qen sequence ", kVersion);
  if (mKind == Kind::kSetting) {
    for (const Value& v : mValues) AppendLine(out, "value", v.header + " " + v.text);
    AppendExpression(out, "profile", mProfile);
    for (const Connection& c : mConnections) {
      AppendLine(out, "connection", DataItem::MakeString(c.generator).AsExpression() + "," +
                                        DataItem::MakeString(c.analyser).AsExpression());
    }
  }
  if (mHasSequence) AppendExpression(out, "sequence", mSequence);
  if (mHasEvents) AppendExpression(out, "events", mEvents);
  out += "end\n";
  return out;
}
