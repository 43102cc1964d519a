#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <vector>

#include "common/SimProcess.h"
#include "instrument/QenTcpInstrument.h"
#include "support/ConditionList.h"
#include "toolkit/qt/QtToolkit.h"

class MainWin;

// The whole library started on Qt (offscreen) against a private qensim, as the window host
// starts it, with alerts recorded instead of shown; a second client on its own connection
// plays another user. One qensim serves a suite.
class GuiSimFixture : public testing::Test {
 protected:
  static void SetUpTestSuite();
  static void TearDownTestSuite();
  void SetUp() override;
  void TearDown() override;

  // A command of the second client under its own handle; its reply.
  Dstring Other(const Dstring& rest);
  double OtherNumber(const Dstring& header);
  // A test-control command of the second client (":TEST:LOCK ON").
  void Control(const Dstring& cmd);
  // One tick of the poll as the alarm and then the main loop run it.
  void Poll();
  // The frame as the window host shows it: attached to the state sources, shown and active.
  static std::unique_ptr<MainWin> ShowMainWin();
  // A saved segment of coding "01" on the instrument, made through the segment pool.
  void MakeSegment(const Dstring& name, long length, long width);

  static inline SimProcess* sSim = nullptr;
  static inline Dstring sDataDir;
  QtToolkit mToolkit;
  std::vector<Dstring> mAlerts;
  ConditionList mList;
  Dstring mHandle;
  Dstring mOtherHandle;
  std::unique_ptr<QenTcpInstrument> mOther;
};

// The QApplication of a test program, offscreen.
void EnsureApplication();
