#pragma once

#include <ostream>
#include <vector>

#include "support/Dstring.h"

// One reported problem: a code (server error number, status or 0), the text shown
// to the user, and, when it came from the message catalogue, its key and arguments. A
// condition that the server gave for a command also keeps that command, so that what shows it
// can say what was refused; it is where the condition came from, not part of what it says.
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
  // The command the server refused; empty for a condition of the program's own.
  const Dstring& GetCommand() const { return mCommand; }
  void SetCommand(const Dstring& command) { mCommand = command; }

  bool operator==(const Condition& other) const {
    return mCode == other.mCode && mMessage == other.mMessage && mKey == other.mKey && mArgs == other.mArgs;
  }

  friend std::ostream& operator<<(std::ostream& out, const Condition& c) {
    return out << c.mCode << ",\"" << c.mMessage << "\"";
  }

 private:
  long mCode = 0;
  Dstring mMessage;
  Dstring mKey;
  std::vector<Dstring> mArgs;
  Dstring mCommand;
};
