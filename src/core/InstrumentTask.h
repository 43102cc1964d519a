#pragma once

#include "support/ConditionList.h"
#include "support/Dstring.h"

// A task the instrument carries out over some seconds, item after item (the self test, the
// automatic deskew), under one command stem: "<stem>:STAR" starts it, "<stem>:STAT?" tells how
// far it is ("IDLE|RUNN|DONE|ABOR",<done>,<items>), "<stem>:ABOR" cancels it. The window that
// shows it asks its progress while the program goes on.
class InstrumentTask {
 public:
  enum class State { Idle, Running, Done, Aborted };
  struct Progress {
    State state = State::Idle;
    unsigned long done = 0;
    unsigned long total = 0;
  };

  explicit InstrumentTask(const char* stem) : mStem(stem) {}

  int Start(ConditionList& list) const;
  int Ask(Progress& out, ConditionList& list) const;
  int Cancel(ConditionList& list) const;
  // "<stem><what>" under the application handle; its reply.
  int Call(const char* what, Dstring& reply, ConditionList& list) const;
  // GUI_STATE_BAD_REPLY for a reply to "<stem><what>" that cannot be read; 1.
  int BadReply(const char* what, const Dstring& reply, ConditionList& list) const;

 private:
  Dstring Command(const char* what) const;

  const char* mStem;
};
