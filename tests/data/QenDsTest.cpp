#include <gtest/gtest.h>

#include <functional>

#include "data/QenDs.h"
#include "data/QenDsView.h"

namespace {

// Records its notifications into a shared log and runs an optional action while notified.
class RecordingView : public QenDsView {
 public:
  RecordingView(std::string name, std::string& log) : mName(std::move(name)), mLog(log) {}
  int NfyViewDataUpdated(QenDs*, ConditionList&) override {
    mLog += mName + ";";
    if (mAction) mAction();
    return mStatus;
  }
  int NfyViewRegistered(QenDs*, ConditionList&) override { mLog += "+" + mName + ";"; return 0; }
  int NfyViewUnregistered(QenDs*, ConditionList&) override { mLog += "-" + mName + ";"; return 0; }

  std::function<void()> mAction;
  int mStatus = 0;

 private:
  std::string mName;
  std::string& mLog;
};

int ProcA(QenDs*, void* client, ConditionList&) {
  *static_cast<std::string*>(client) += "procA;";
  return 0;
}

class QenDsTest : public testing::Test {
 protected:
  QenDsTest() : mSource(new QenDs) {}
  ~QenDsTest() override { mSource->Release(); }
  QenDs* mSource;
  std::string mLog;
  ConditionList mList;
};

}  // namespace

TEST_F(QenDsTest, NotifiesInRegistrationOrder) {
  RecordingView a("a", mLog), b("b", mLog);
  mSource->RegisterView(&a, mList);
  mSource->RegisterProc(&ProcA, &mLog);
  mSource->RegisterView(&b, mList);
  mLog.clear();
  EXPECT_EQ(mSource->Update(mList, 0), 0);
  EXPECT_EQ(mLog, "a;procA;b;");
}

TEST_F(QenDsTest, ViewUnregisteringALaterViewStopsItsNotification) {
  RecordingView a("a", mLog), b("b", mLog), c("c", mLog);
  for (auto* v : {&a, &b, &c}) mSource->RegisterView(v, mList);
  a.mAction = [&] { mSource->UnregisterView(&b, mList); };
  mLog.clear();
  mSource->Update(mList, 0);
  EXPECT_EQ(mLog, "a;-b;c;");
}

TEST_F(QenDsTest, ViewRegisteredDuringNotificationIsToldFromTheNextPass) {
  RecordingView a("a", mLog), late("late", mLog);
  mSource->RegisterView(&a, mList);
  a.mAction = [&] {
    mSource->RegisterView(&late, mList);
    a.mAction = nullptr;
  };
  mLog.clear();
  mSource->Update(mList, 0);
  EXPECT_EQ(mLog, "a;+late;");
  mLog.clear();
  mSource->Update(mList, 0);
  EXPECT_EQ(mLog, "a;late;");
}

TEST_F(QenDsTest, UnregisteredThenRegisteredAgainDuringThePassIsStillTold) {
  RecordingView a("a", mLog), b("b", mLog);
  mSource->RegisterView(&a, mList);
  mSource->RegisterView(&b, mList);
  a.mAction = [&] {
    mSource->UnregisterView(&b, mList);
    mSource->RegisterView(&b, mList);
  };
  mLog.clear();
  mSource->Update(mList, 0);
  EXPECT_EQ(mLog, "a;-b;+b;b;");
}

TEST_F(QenDsTest, FirstFailureStopsThePass) {
  RecordingView a("a", mLog), b("b", mLog);
  mSource->RegisterView(&a, mList);
  mSource->RegisterView(&b, mList);
  a.mStatus = 7;
  mLog.clear();
  EXPECT_EQ(mSource->Update(mList, 0), 7);
  EXPECT_EQ(mLog, "a;");
}

TEST_F(QenDsTest, UnregisteringAStrangerAddsTheKey) {
  RecordingView a("a", mLog);
  EXPECT_EQ(mSource->UnregisterView(&a, mList), 1);
  EXPECT_TRUE(mList.HasKey("GUI_QENDS_VIEWNOTREGISTERED"));
  mSource->UnregisterProc(&ProcA, &mLog);
  EXPECT_EQ(mSource->NumViews(), 0u);
}

TEST_F(QenDsTest, ReferenceCounting) {
  auto* other = new QenDs;
  EXPECT_EQ(other->Use(), 2u);
  EXPECT_EQ(other->Release(), 1u);
  EXPECT_EQ(other->Release(), 0u);
}

TEST_F(QenDsTest, ViewReleasingTheLastReferenceDuringThePassIsSafe) {
  auto* doomed = new QenDs;
  RecordingView a("a", mLog), b("b", mLog);
  doomed->RegisterView(&a, mList);
  doomed->RegisterView(&b, mList);
  a.mAction = [&] { doomed->Release(); };
  EXPECT_EQ(doomed->Update(mList, 0), 0);
  EXPECT_EQ(mLog, "+a;+b;a;b;");
}
