#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include "support/Dstring.h"

// One typed value of a reply or expression.
enum class DataItemType : std::uint8_t { Signed, Unsigned, Float, Double, String, Word, Block };

// 40 bytes a node: the value and a text of up to 24 bytes are held in place, a longer text (or
// a block) is a view into a shared string, so the items of one parsed text share one copy of it.
class DataItem {
 public:
  // Texts up to this size are held in place; longer ones are shared.
  static constexpr std::size_t kInlineSize = 24;

  DataItem() noexcept {}  // an empty bare word, as between two commas
  DataItem(const DataItem& other) : mType(other.mType), mQuote(other.mQuote), mUnsigned(other.mUnsigned) {
    CopyTextFrom(other);
  }
  DataItem(DataItem&& other) noexcept : mType(other.mType), mQuote(other.mQuote), mUnsigned(other.mUnsigned) {
    MoveTextFrom(other);
  }
  DataItem& operator=(const DataItem& other);
  DataItem& operator=(DataItem&& other) noexcept;
  ~DataItem() {
    if (!mInline) ReleaseText();
  }

  static DataItem MakeSigned(long long v);
  static DataItem MakeUnsigned(unsigned long long v);
  static DataItem MakeFloat(float v);
  static DataItem MakeDouble(double v);
  static DataItem MakeString(std::string_view text, char quote = '"');
  static DataItem MakeWord(std::string_view text);
  // A block refers to `bytes`, which must stay alive as long as `owner` does.
  static DataItem MakeBlock(std::string_view bytes, std::shared_ptr<const std::string> owner);
  // Writes into `out` a string whose text lies in `owner`, which must hold it when the text is
  // longer than the in-place text (the parser's texts).
  static void FromString(std::string_view text, char quote, DataItem& out,
                         const std::shared_ptr<const std::string>& owner);
  // Reads a bare token: a number keeping the token as its text, or else a word.
  // False when the token is a number that does not fit its type ("1e400", "-1u").
  static bool FromToken(std::string_view token, DataItem& out);
  // As above; a token longer than the in-place text refers into `owner` when it is given.
  static bool FromToken(std::string_view token, DataItem& out, const std::shared_ptr<const std::string>& owner);

  DataItemType GetType() const { return mType; }
  bool IsNumber() const;
  bool IsInteger() const { return mType == DataItemType::Signed || mType == DataItemType::Unsigned; }
  bool IsText() const { return mType == DataItemType::String || mType == DataItemType::Word; }
  char GetQuote() const { return mQuote; }
  // The text is held in place, not shared: the item owns nothing beyond itself.
  bool IsInPlace() const { return mInline; }

  // Conversions; false when the value does not fit the asked type.
  bool GetLong(long& out) const;
  bool GetULong(unsigned long& out) const;
  bool GetDouble(double& out) const;
  bool GetFloat(float& out) const;

  // String and word: the text without quotes; block: the bytes; numbers: the value as written.
  std::string_view GetText() const;

  // The item written back in expression form: quotes doubled inside strings, number suffixes
  // kept ("12i", "1.5f"), blocks as "#<n><length><bytes>".
  Dstring AsExpression() const;

  bool operator==(const DataItem& other) const;

 private:
  struct Shared {
    const char* data;
    std::shared_ptr<const std::string> owner;
  };

  void SetText(std::string_view text);
  // A text of at most kInlineSize bytes, held in place.
  void SetInPlace(std::string_view text);
  void SetShared(std::string_view text, std::shared_ptr<const std::string> owner);
  // In place when it fits, else a view into `owner` (when there is one) or a shared copy.
  void SetTokenText(std::string_view text, const std::shared_ptr<const std::string>& owner);
  void ReleaseText();
  // Both are only called on an item whose text is released (in place and empty).
  void CopyTextFrom(const DataItem& other) {
    mSize = other.mSize;
    mInline = other.mInline;
    if (mInline) {
      __builtin_memcpy(mChars, other.mChars, kInlineSize);
    } else {
      CopySharedFrom(other);
    }
  }
  void MoveTextFrom(DataItem& other) noexcept {
    mSize = other.mSize;
    mInline = other.mInline;
    if (mInline) {
      __builtin_memcpy(mChars, other.mChars, kInlineSize);
    } else {
      MoveSharedFrom(other);
    }
  }
  void CopySharedFrom(const DataItem& other);
  void MoveSharedFrom(DataItem& other) noexcept;

  DataItemType mType = DataItemType::Word;
  char mQuote = '"';
  bool mInline = true;
  std::uint32_t mSize = 0;
  union {
    long long mSigned = 0;
    unsigned long long mUnsigned;
    double mDouble;
  };
  union {
    char mChars[kInlineSize] = {};
    Shared mShared;
  };
};
