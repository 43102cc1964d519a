#pragma once

#include <deque>
#include <functional>

#include "support/Condition.h"
#include "support/Dstring.h"

// Every condition reported in this session, with the time and the command that caused it:
// what the error list window shows. Static; Install makes it the call path's error listener.
class ErrorJournal {
 public:
  struct Entry {
    Dstring time;  // "HH:MM:SS"
    long code = 0;
    Dstring text;
    Dstring command;  // empty when no command caused it
  };
  static constexpr std::size_t kMaxEntries = 10000;

  static void Install();
  static void Uninstall();
  static void Add(const Dstring& command, const Condition& condition);
  // Newest first.
  static const std::deque<Entry>& Entries() { return mEntries; }
  static void Clear();
  // Told after every Add and Clear; null removes it.
  static void SetListener(std::function<void()> listener) { mListener = std::move(listener); }

 private:
  static std::deque<Entry> mEntries;
  static std::function<void()> mListener;
};
