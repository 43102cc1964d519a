#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include "support/Dstring.h"

// One typed value of a reply or expression.
enum class DataItemType { Signed, Unsigned, Float, Double, String, Word, Block };

class DataItem {
 public:
  DataItem() = default;  // an empty bare word, as between two commas

  static DataItem MakeSigned(long long v);
  static DataItem MakeUnsigned(unsigned long long v);
  static DataItem MakeFloat(float v);
  static DataItem MakeDouble(double v);
  static DataItem MakeString(std::string_view text, char quote = '"');
  static DataItem MakeWord(std::string_view text);
  // A block refers to `bytes`, which must stay alive as long as `owner` does.
  static DataItem MakeBlock(std::string_view bytes, std::shared_ptr<const std::string> owner);
  // Reads a bare token: a number keeping the token as its text, or else a word.
  // False when the token is a number that does not fit its type ("1e400", "-1u").
  static bool FromToken(std::string_view token, DataItem& out);

  DataItemType GetType() const { return mType; }
  bool IsNumber() const;
  bool IsInteger() const { return mType == DataItemType::Signed || mType == DataItemType::Unsigned; }
  bool IsText() const { return mType == DataItemType::String || mType == DataItemType::Word; }
  char GetQuote() const { return mQuote; }

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
  DataItemType mType = DataItemType::Word;
  char mQuote = '"';
  long long mSigned = 0;
  unsigned long long mUnsigned = 0;
  double mDouble = 0.0;
  std::string mText;
  std::string_view mBlock;
  std::shared_ptr<const std::string> mOwner;
};
