#pragma once

#include <gtest/gtest.h>

#include <filesystem>
#include <memory>
#include <unistd.h>

#include "common/SimProcess.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenTcpInstrument.h"
#include "settings/MemoryRegistryStore.h"
#include "settings/QENRegistryProfile.h"
#include "settings/QENSettingProfile.h"
#include "support/QenEnvironment.h"

// QenGuiInst talking to a private qensim (test control on, its own data directory) over a
// real socket, under a fresh handle; the registry lives in memory. One qensim per suite.
class SimClientFixture : public testing::Test {
 protected:
  static void SetUpTestSuite() {
    sDataDir = (std::filesystem::temp_directory_path() / ("qengui-settings-" + std::to_string(::getpid()))).string();
    sSim = new SimProcess({"--test-control", "--data-dir", sDataDir});
  }
  static void TearDownTestSuite() {
    delete sSim;
    sSim = nullptr;
    std::filesystem::remove_all(sDataDir.c_str());
  }

  void SetUp() override {
    ASSERT_NE(sSim->Port(), 0) << "qensim did not start";
    QenEnvironment::SetLogDirectory(sDataDir);
    QenGuiInst::Init();
    auto inst = std::make_unique<QenTcpInstrument>();
    ASSERT_EQ(inst->Connect("127.0.0.1", sSim->Port()), 0);
    Dstring handle;
    ASSERT_EQ(inst->Call(":QEN:INST:HAND:CRE? _T,\"PSX\",\"T\"", handle), 0);
    QenGuiInst::SetInstrument(std::move(inst));
    QenGuiInst::SetAppHandle(handle);
    QENRegistryProfile::SetStore(&mRegistry);
    QENSettingProfile::Init(nullptr);
  }
  void TearDown() override {
    QENSettingProfile::End();
    QENRegistryProfile::SetStore(nullptr);
    QenGuiInst::End();
    QenEnvironment::SetLogDirectory(std::nullopt);
  }

  // Sends ":<handle><rest>"; its status.
  int Send(const Dstring& rest, Dstring* reply = nullptr) {
    Dstring ignored;
    ConditionList list;
    return QenGuiInst::Call(":" + QenGuiInst::GetAppHandle() + rest, reply ? *reply : ignored, list);
  }

  static inline SimProcess* sSim = nullptr;
  static inline Dstring sDataDir;
  MemoryRegistryStore mRegistry;
  ConditionList mList;
};
