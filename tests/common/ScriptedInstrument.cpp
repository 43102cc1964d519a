#include "common/ScriptedInstrument.h"

#include <gtest/gtest.h>

#include "instrument/QenStatus.h"

void ScriptedInstrument::Expect(const Dstring& cmd, const Dstring& reply, int status) {
  mSteps.push_back({cmd, reply, status});
}

int ScriptedInstrument::Connect(const Dstring&, unsigned short) {
  mConnected = true;
  return QenStatus::kOk;
}

int ScriptedInstrument::Disconnect() {
  mConnected = false;
  return QenStatus::kOk;
}

int ScriptedInstrument::Call(const Dstring& cmd, Dstring& reply) {
  mSent.push_back(cmd);
  if (!mSteps.empty()) {
    Step step = mSteps.front();
    mSteps.pop_front();
    EXPECT_EQ(step.cmd, cmd) << "the command sent differs from the script";
    reply = step.reply;
    return step.cmd == cmd ? step.status : QenStatus::kCommError;
  }
  if (mHandler) return mHandler(cmd, reply);
  ADD_FAILURE() << "unexpected command: " << cmd;
  return QenStatus::kCommError;
}
