#pragma once

#include <gtest/gtest.h>

#include <unistd.h>

#include <filesystem>
#include <memory>
#include <string>
#include <vector>

#include "common/SimProcess.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenTcpInstrument.h"
#include "segments/QenSegmentDs.h"
#include "segments/QenSegmentPool.h"
#include "segments/SegmentBuffer.h"
#include "support/QenEnvironment.h"

// The segment pool on a private qensim over a real socket, with a second client that plays
// another user.
class SegmentSimFixture : public testing::Test {
 protected:
  void SetUp() override {
    std::filesystem::remove_all(mDir);
    QenEnvironment::SetLogDirectory(Dstring(mDir));
    QenGuiInst::Init();
    QenSegmentPool::Init();
    StartServer();
  }

  void TearDown() override {
    QenSegmentPool::End();
    QenGuiInst::End();
    mSim.reset();
    QenEnvironment::SetLogDirectory(std::nullopt);
    std::filesystem::remove_all(mDir);
  }

  // A qensim on the test's data directory, the one call path connected to it as "_T", and a
  // second client "_O" that plays another user.
  void StartServer() {
    mSim = std::make_unique<SimProcess>(std::vector<std::string>{"--test-control", "--data-dir", mDir});
    ASSERT_NE(mSim->Port(), 0);
    auto client = std::make_unique<QenTcpInstrument>();
    ASSERT_EQ(client->Connect("127.0.0.1", mSim->Port()), 0);
    Dstring handle;
    ASSERT_EQ(client->Call(":QEN:INST:HAND:CRE? _T,\"PSX\",\"T\"", handle), 0);
    QenGuiInst::SetInstrument(std::move(client));
    QenGuiInst::SetAppHandle(handle);
    ASSERT_EQ(mOther.Connect("127.0.0.1", mSim->Port()), 0);
    ASSERT_EQ(mOther.Call(":QEN:INST:HAND:CRE? _O,\"PSX\",\"T\"", handle), 0);
  }

  // Another user's command on the open segment `number`.
  int Other(const Dstring& tail, unsigned number) {
    Dstring reply;
    return mOther.Call(Dstring::Format(":_O:EDIT:SEGM%u%s", number, tail.c_str()), reply);
  }

  QenSegmentDs* Make(const Dstring& name, const Dstring& coding, long length, long width) {
    SegmentProperties p;
    p.name = name;
    p.coding = coding;
    p.length = length;
    p.width = width;
    unsigned created = 0;
    EXPECT_EQ(QenSegmentPool::Create(p, created, mList), 0) << mList.ToText();
    QenSegmentDs* ds = QenSegmentPool::AllocDs(name);
    EXPECT_EQ(ds->Open(mList), 0) << mList.ToText();
    return ds;
  }

  SegmentBuffer* Window(QenSegmentDs* ds, long start, long length) {
    SegmentBuffer* buffer = nullptr;
    ds->CreateBuffer(buffer, mList);
    EXPECT_EQ(ds->Init(buffer, mList), 0) << mList.ToText();
    EXPECT_EQ(ds->SetBufferStartAndLength(buffer, start, length, mList), 0) << mList.ToText();
    return buffer;
  }

  std::string mDir = testing::TempDir() + "qen-segments-" + std::to_string(::getpid());
  std::unique_ptr<SimProcess> mSim;
  QenTcpInstrument mOther;
  ConditionList mList;
};
