#pragma once

#include <ostream>
#include <vector>

#include "support/Dstring.h"

// One reported problem: a code (server error number, status or 0), the text shown
// to the user, and, when it came from the message catalogue, its key and arguments.
class Condition {
 public:
  Condition() = default;
  Condition(long code, Dstring message) : mCode(code), mMessage(std::move(message)) {}
  Condition(long code, Dstring message, Dstring key, std::vector<Dstring> args)
      : mCode(code), mMessage(std::move(message)), mKey(std::move(key)), mArgs(std::move(args)) {}

  long GetCode() const { return mCode; }
  const Dstring& GetMessage() const { return mMessage; }
  const Dstring& GetKey() const { return mKey; }
  const std::vector<Dstring>& GetArgs() const { return mArgs; }

  bool operator==(const Condition&) const = default;

  friend std::ostream& operator<<(std::ostream& out, const Condition& c) {
    return out << c.mCode << ",\"" << c.mMessage << "\"";
  }

 private:
  long mCode = 0;
  Dstring mMessage;
  Dstring mKey;
  std::vector<Dstring> mArgs;
};
