#include "common/InstrumentFixture.h"

#include <filesystem>
#include <memory>
#include <unistd.h>

#include "support/QenEnvironment.h"

void InstrumentFixture::SetUp() {
  auto dir = std::filesystem::temp_directory_path() / ("qengui-fixture-" + std::to_string(::getpid()));
  QenEnvironment::SetLogDirectory(Dstring(dir.string()));
  QenGuiInst::Init();
  auto inst = std::make_unique<ScriptedInstrument>();
  mInst = inst.get();
  QenGuiInst::SetInstrument(std::move(inst));
  QenGuiInst::SetAppHandle("_H");
  QenGuiInst::SetServerDeathHandler([this](const Dstring& m) { mDeaths.push_back(m); });
}

void InstrumentFixture::TearDown() {
  EXPECT_TRUE(mInst->AllConsumed()) << "the script expected more commands";
  QenGuiInst::End();
  QenEnvironment::SetLogDirectory(std::nullopt);
}
