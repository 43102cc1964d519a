#pragma once

#include <array>
#include <cstddef>
#include <vector>

#include "support/ConditionList.h"
#include "support/Dstring.h"

// The table of the ten sequence events, read and written as one expression:
// "(3.0," + the 10 events joined by "," + ")"; an event is ("name",number,(items)) and an
// item ('a','b','c',bare). The meaning of names, numbers and items is the instrument's: the
// program keeps them as read and writes them back unchanged.
class CSequenceEvents {
 public:
  static constexpr std::size_t kNumEvents = 10;

  struct Item {
    Dstring first;
    Dstring second;
    Dstring third;
    Dstring bare;  // written as it stands, without quotes
    bool operator==(const Item&) const = default;
  };
  struct Event {
    Dstring name;
    int number = 0;
    std::vector<Item> items;
    bool operator==(const Event&) const = default;
  };

  const std::array<Event, kNumEvents>& GetEvents() const { return mEvents; }
  const Event& GetEvent(std::size_t index) const { return mEvents[index]; }
  void SetEvent(std::size_t index, const Event& event) { mEvents[index] = event; }
  // All ten events empty (a system without a central module).
  void Reset();

  // Replaces the table with the events of `text`; on failure "GUI_SEQUENCE_EVENT_EXPR_SYNTAX"
  // and status 1, the table unchanged.
  int FromExpression(const Dstring& text, ConditionList& cond);
  // Builds the expression and keeps it as the text last built.
  const Dstring& BuildExpression();
  const Dstring& GetLastBuilt() const { return mLastBuilt; }

  bool operator==(const CSequenceEvents& other) const { return mEvents == other.mEvents; }

 private:
  std::array<Event, kNumEvents> mEvents;
  Dstring mLastBuilt;
};
