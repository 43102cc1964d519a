#include "support/ParserExpression.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <memory>
#include <string>
#include <utility>

#include "support/ConditionListLoader.h"

namespace {

constexpr int kSyntaxError = 1;
constexpr std::size_t kMaxDepth = 256;
constexpr std::size_t kExcerptHalf = 30;
constexpr std::size_t kNone = std::string_view::npos;
constexpr std::size_t kKeptElements = std::size_t{1} << 16;

bool IsBlank(char c) {
  return c == ' ' || c == '\t' || c == '\r' || c == '\n';
}
bool IsQuote(char c) {
  return c == '"' || c == '\'';
}
bool IsDelimiter(char c) {
  return c == ',' || c == '(' || c == ')';
}
bool IsDigit(char c) {
  return c >= '0' && c <= '9';
}
// Bytes that neither end a bare token nor start anything: the bulk of every text.
constexpr std::array<bool, 256> kPlain = [] {
  std::array<bool, 256> plain{};
  plain.fill(true);
  for (unsigned char c : std::string_view(" \t\r\n,()\"'#")) plain[c] = false;
  return plain;
}();
bool IsPlain(char c) {
  return kPlain[static_cast<unsigned char>(c)];
}
std::size_t SkipPlain(std::string_view text, std::size_t pos) {
  while (pos < text.size() && IsPlain(text[pos])) ++pos;
  return pos;
}
// Where `quote` next stands at or after `from`. Most strings of a reply are a few bytes long,
// shorter than what a library search needs to pay off, so those are looked at byte by byte.
std::size_t FindQuote(std::string_view text, char quote, std::size_t from) {
  const std::size_t near = std::min(text.size(), from + 32);
  for (std::size_t pos = from; pos < near; ++pos) {
    if (text[pos] == quote) return pos;
  }
  return near < text.size() ? text.find(quote, near) : kNone;
}
bool IsUtf8Continuation(char c) {
  return (static_cast<unsigned char>(c) & 0xC0) == 0x80;
}

// At most 60 bytes around the offset, not cutting a UTF-8 character, control bytes shown as '?'.
Dstring Excerpt(std::string_view text, std::size_t at) {
  std::size_t from = at > kExcerptHalf ? at - kExcerptHalf : 0;
  std::size_t to = std::min(text.size(), at + kExcerptHalf);
  while (from < at && IsUtf8Continuation(text[from])) ++from;
  while (to > at && to < text.size() && IsUtf8Continuation(text[to])) --to;
  Dstring excerpt(text.substr(from, to - from));
  for (char& c : excerpt) {
    if (static_cast<unsigned char>(c) < 0x20 || c == 0x7F) c = '?';
  }
  return excerpt;
}

int Fail(std::string_view text, std::size_t at, const Dstring& reason, ConditionList& list) {
  ConditionListLoader::ConditionToken(list, "GUI_PARSER_SYNTAX",
                                      {Excerpt(text, at), Dstring(std::to_string(at)), reason});
  return kSyntaxError;
}

// Where the bytes of the definite-length block starting at `at` ('#') lie; `error` is set
// (and `errorAt` points at the fault) when the header is malformed or the length lies.
struct BlockSpan {
  std::size_t data = 0;
  std::size_t length = 0;
  std::size_t errorAt = 0;
  const char* error = nullptr;
};

BlockSpan ReadBlock(std::string_view text, std::size_t at) {
  BlockSpan span;
  span.errorAt = at + 1;
  if (at + 1 >= text.size() || text[at + 1] < '1' || text[at + 1] > '9') {
    span.error = "'#' must be followed by a digit 1 to 9 giving the size of the block length";
    return span;
  }
  std::size_t digits = static_cast<std::size_t>(text[at + 1] - '0');
  span.data = at + 2 + digits;
  for (std::size_t i = at + 2; i < span.data; ++i) {
    if (i >= text.size() || !IsDigit(text[i])) {
      span.errorAt = i;
      span.error = "the block length has fewer digits than its header says";
      return span;
    }
    span.length = span.length * 10 + static_cast<std::size_t>(text[i] - '0');
  }
  if (span.length > text.size() - span.data) {
    span.errorAt = at;
    span.error = "the block is longer than the rest of the text";
  }
  return span;
}

// Reads a whole text into a tree. The elements of every open list are gathered on one stack;
// at its ')' a list takes its own off the top, into an array of exactly their number.
class Reader {
 public:
  Reader(std::string_view text, ConditionList& list, ParserExpression::Sink* sink = nullptr)
      : mText(text), mList(list), mSink(sink), mSinkDepth(sink ? sink->Depth() : 0), mElements(ThreadElements()) {}
  Reader(const Reader&) = delete;
  Reader& operator=(const Reader&) = delete;
  ~Reader();

  int Read(LispList& out);
  // Where the first list inside the result starts, or kNone when the result is flat.
  std::size_t NestedListAt() const { return mUnwrapped ? mFirstInnerOpen : mFirstOpen; }

 private:
  // An open list: where its '(' stands, and where its elements begin on the stack.
  struct Open {
    std::size_t at = 0;
    std::size_t first = 0;
    std::size_t seen = 0;  // elements completed, those a sink took included
  };

  // Shows the element just completed to the sink, which may take it off the stack.
  void Offer();

  // A new empty item at the end of the open list, to be written in place.
  DataItem& AppendItem() { return *mElements.emplace_back(std::in_place).GetMutableItem(); }
  // Takes the innermost open list's elements off the stack.
  LispList TakeOpenList();
  // The shared copy of the text that long texts and blocks refer into, made when first needed.
  const std::shared_ptr<const std::string>& Owner();
  // The bytes at [at, at + size) of the text; inside the shared copy when they are too long
  // to be held in place by an item.
  std::string_view Shared(std::size_t at, std::size_t size);
  bool CurrentIsEmpty() const { return mElements.size() == mStack.back().first; }
  bool At(char c) const { return mPos < mText.size() && mText[mPos] == c; }
  void SkipBlanks();
  int Element();
  int AfterElement(bool& expectElement);
  int OpenList();
  int CloseList();
  int Finish(LispList& out);
  int ReadString();
  int ReadBlockItem();
  int ReadBare();
  int Fail(std::size_t at, const Dstring& reason) { return ::Fail(mText, at, reason, mList); }

  std::string_view mText;
  ConditionList& mList;
  std::size_t mPos = 0;
  ParserExpression::Sink* mSink;
  std::size_t mSinkDepth;
  std::vector<Open> mStack;
  // The stack is the thread's, kept from parse to parse so that it need not grow each time.
  static std::vector<LispList>& ThreadElements();
  std::vector<LispList>& mElements;
  std::shared_ptr<const std::string> mOwner;
  std::size_t mFirstOpen = kNone;
  std::size_t mFirstInnerOpen = kNone;
  std::size_t mDeepestOpen = kNone;
  bool mUnwrapped = false;
};

std::vector<LispList>& Reader::ThreadElements() {
  thread_local std::vector<LispList> elements;
  return elements;
}

// Left empty for the next parse, and small again after a very long list.
Reader::~Reader() {
  mElements.clear();
  if (mElements.capacity() > kKeptElements) std::vector<LispList>().swap(mElements);
}

int Reader::Read(LispList& out) {
  mStack.assign(1, Open{});
  bool expectElement = true;
  for (;;) {
    SkipBlanks();
    int rc = 0;
    if (expectElement && At('(')) {
      rc = OpenList();
    } else if (expectElement) {
      const std::size_t before = mElements.size();
      rc = Element();
      if (mSinkDepth != 0 && rc == 0 && mElements.size() > before) Offer();
      expectElement = false;
    } else if (mPos == mText.size()) {
      return Finish(out);
    } else {
      rc = AfterElement(expectElement);
    }
    if (rc != 0) return rc;
  }
}

void Reader::SkipBlanks() {
  while (mPos < mText.size() && IsBlank(mText[mPos])) ++mPos;
}

// Nothing before ')' or the end is no element at all when the list is still empty ("()"),
// and an empty word otherwise ("(a,)", "(,)").
int Reader::Element() {
  if (mPos == mText.size() || At(')') || At(',')) {
    if (!CurrentIsEmpty() || At(',')) AppendItem();
    return 0;
  }
  if (IsQuote(mText[mPos])) return ReadString();
  if (At('#')) return ReadBlockItem();
  return ReadBare();
}

int Reader::AfterElement(bool& expectElement) {
  if (At(',')) {
    ++mPos;
    expectElement = true;
    return 0;
  }
  if (At(')')) return CloseList();
  return Fail(mPos, "expected ',' or ')' after the element");
}

// Tree depth counts the top list; a text that is one list loses that outer level, so one
// more level is allowed while reading and checked in Finish once that is known.
int Reader::OpenList() {
  if (mStack.size() > kMaxDepth) return Fail(mPos, "lists are nested deeper than 256 levels");
  if (mStack.size() == kMaxDepth && mDeepestOpen == kNone) mDeepestOpen = mPos;
  if (mFirstOpen == kNone) mFirstOpen = mPos;
  if (mStack.size() > 1 && mFirstInnerOpen == kNone) mFirstInnerOpen = mPos;
  mStack.push_back(Open{mPos, mElements.size()});
  ++mPos;
  return 0;
}

LispList Reader::TakeOpenList() {
  const std::size_t first = mStack.back().first;
  LispList list = LispList::Adopt(mElements.data() + first, mElements.size() - first);
  mElements.erase(mElements.begin() + static_cast<std::ptrdiff_t>(first), mElements.end());
  mStack.pop_back();
  return list;
}

int Reader::CloseList() {
  if (mStack.size() == 1) return Fail(mPos, "')' without a matching '('");
  mElements.push_back(TakeOpenList());
  if (mSinkDepth != 0) Offer();
  ++mPos;
  return 0;
}

void Reader::Offer() {
  const std::size_t depth = mStack.size() - 1;
  if (depth == 0 || depth > mSinkDepth) return;
  if (mSink->Take(depth, mStack.back().seen++, mElements.back())) mElements.pop_back();
}

const std::shared_ptr<const std::string>& Reader::Owner() {
  if (!mOwner) mOwner = std::make_shared<const std::string>(mText);
  return mOwner;
}

std::string_view Reader::Shared(std::size_t at, std::size_t size) {
  if (size <= DataItem::kInlineSize) return mText.substr(at, size);
  return std::string_view(*Owner()).substr(at, size);
}

int Reader::Finish(LispList& out) {
  if (mStack.size() > 1) return Fail(mStack.back().at, "'(' without a matching ')'");
  LispList top = TakeOpenList();
  mUnwrapped = top.Size() == 1 && top[0].IsList();
  if (!mUnwrapped && mDeepestOpen != kNone)
    return Fail(mDeepestOpen, "lists are nested deeper than 256 levels");
  if (mUnwrapped) {
    LispList only = std::move(top[0]);
    out = std::move(only);
  } else {
    out = std::move(top);
  }
  return 0;
}

// A string without doubled quotes is taken as it stands in the text; only one with them is
// copied to undo the doubling.
int Reader::ReadString() {
  std::size_t start = mPos;
  char quote = mText[mPos++];
  std::size_t close = FindQuote(mText, quote, mPos);
  if (close == kNone) return Fail(start, "the string has no closing quote");
  if (close + 1 >= mText.size() || mText[close + 1] != quote) {
    DataItem::FromString(Shared(mPos, close - mPos), quote, AppendItem(), mOwner);
    mPos = close + 1;
    return 0;
  }
  std::string value;
  for (;;) {
    value.append(mText.substr(mPos, close - mPos));
    mPos = close + 1;
    if (!At(quote)) break;
    value += quote;
    close = FindQuote(mText, quote, ++mPos);
    if (close == kNone) return Fail(start, "the string has no closing quote");
  }
  AppendItem() = DataItem::MakeString(value, quote);
  return 0;
}

// All blocks of one text share a single copy of it, made when the first block is met.
int Reader::ReadBlockItem() {
  BlockSpan span = ReadBlock(mText, mPos);
  if (span.error != nullptr) return Fail(span.errorAt, span.error);
  const std::shared_ptr<const std::string>& owner = Owner();
  AppendItem() = DataItem::MakeBlock(std::string_view(*owner).substr(span.data, span.length), owner);
  mPos = span.data + span.length;
  return 0;
}

int Reader::ReadBare() {
  std::size_t start = mPos;
  std::size_t end = mPos;
  while (end < mText.size() && !IsDelimiter(mText[end]) && !IsQuote(mText[end])) end = SkipPlain(mText, end + 1);
  if (end < mText.size() && IsQuote(mText[end])) return Fail(end, "a quote inside a bare word");
  std::size_t last = end;
  while (IsBlank(mText[last - 1])) --last;
  if (!DataItem::FromToken(Shared(start, last - start), AppendItem(), mOwner)) {
    return Fail(start, "the number does not fit its type");
  }
  mPos = end;
  return 0;
}

}  // namespace

int ParserExpression::Parse(std::string_view text, LispList& out, ConditionList& list) {
  return Reader(text, list).Read(out);
}

int ParserExpression::Parse(std::string_view text, LispList& out, ConditionList& list, Sink& sink) {
  return Reader(text, list, &sink).Read(out);
}

int ParserExpression::Parse(std::string_view text, DataParcel& out, ConditionList& list) {
  Reader reader(text, list);
  LispList tree;
  if (int rc = reader.Read(tree)) return rc;
  if (std::size_t at = reader.NestedListAt(); at != kNone) {
    return Fail(text, at, "a list inside a list of plain values", list);
  }
  DataParcel items;
  items.reserve(tree.Size());
  for (const LispList& child : tree) items.push_back(child.GetItem());
  out = std::move(items);
  return 0;
}

int ParserExpression::SplitJoined(std::string_view text, std::vector<std::string_view>& parts,
                                  ConditionList& list) {
  std::vector<std::string_view> found;
  std::size_t start = 0;
  bool tokenStart = true;
  for (std::size_t pos = 0; pos < text.size();) {
    char c = text[pos];
    if (c == ';') {
      found.push_back(text.substr(start, pos - start));
      start = ++pos;
      tokenStart = true;
    } else if (IsQuote(c)) {
      std::size_t close = FindQuote(text, c, pos + 1);
      if (close == kNone) return Fail(text, pos, "the string has no closing quote", list);
      pos = close + 1;
      tokenStart = false;
    } else if (c == '#' && tokenStart) {
      BlockSpan span = ReadBlock(text, pos);
      if (span.error != nullptr) return Fail(text, span.errorAt, span.error, list);
      pos = span.data + span.length;
      tokenStart = false;
    } else {
      tokenStart = IsBlank(c) || IsDelimiter(c);
      ++pos;
    }
  }
  found.push_back(text.substr(start));
  parts = std::move(found);
  return 0;
}

int ParserExpression::ParseElements(std::string_view text, LispList& out, ConditionList& list) {
  // The text must stand on its own: "1),(2" is no text, though "(1),(2)" is.
  LispList alone;
  if (int status = Parse(text, alone, list)) return status;
  const std::string wrapped = "(" + std::string(text) + ")";
  return Parse(wrapped, out, list);
}
