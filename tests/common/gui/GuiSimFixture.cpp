#include "common/gui/GuiSimFixture.h"

#include <unistd.h>

#include <QApplication>
#include <filesystem>
#include <string>

#include "core/ErrorJournal.h"
#include "core/uiapp.h"
#include "instrument/AppHandle.h"
#include "instrument/QenGuiInst.h"
#include "params/ui/BoundControlClasses.h"
#include "segments/QenSegmentPool.h"
#include "segments/SegmentProperties.h"
#include "windows/GridClasses.h"
#include "windows/MainWin.h"
#include "toolkit/Toolkit.h"
#include "toolkit/qt/WidgetClassTable.h"

// The system's font library keeps caches for the life of the process.
extern "C" const char* __lsan_default_suppressions() { return "leak:libfontconfig.so\n"; }

void EnsureApplication() {
  static int argc = 1;
  static char name[] = "qen_gui_test";
  static char* argv[] = {name, nullptr};
  qputenv("QT_QPA_PLATFORM", "offscreen");
  if (QApplication::instance() == nullptr) new QApplication(argc, argv);
}

// Test programs run side by side: each qensim keeps its segments in a folder of its own.
void GuiSimFixture::SetUpTestSuite() {
  EnsureApplication();
  sDataDir = (std::filesystem::temp_directory_path() / ("qengui-gui-" + std::to_string(::getpid()))).string();
  sSim = new SimProcess({"--test-control", "--data-dir", sDataDir});
}

void GuiSimFixture::TearDownTestSuite() {
  delete sSim;
  sSim = nullptr;
  std::error_code ignored;
  std::filesystem::remove_all(sDataDir.c_str(), ignored);
}

void GuiSimFixture::SetUp() {
  ASSERT_NE(sSim->Port(), 0);
  Toolkit::Install(&mToolkit);
  mToolkit.SetAlertSink([this](const Dstring& text, ToolkitPort::Icon) { mAlerts.push_back(text); });
  BoundControlClasses::AddFactories();
  GridClasses::AddFactories();
  ASSERT_EQ(uiapp::LoadDatLib(mList), 0) << mList.ToText();
  ASSERT_EQ(uiapp::RegisterClasses(mList), 0) << mList.ToText();
  ASSERT_EQ(uiapp::Init(mList), 0);
  ErrorJournal::Install();
  ErrorJournal::Clear();
  auto inst = std::make_unique<QenTcpInstrument>();
  ASSERT_EQ(inst->Connect("127.0.0.1", sSim->Port()), 0);
  mHandle = "_G";
  ASSERT_EQ(AppHandle::Create(inst.get(), mHandle, "G", mList), 0);
  QenGuiInst::SetInstrument(std::move(inst));
  QenGuiInst::SetAppHandle(mHandle);
  mOther = std::make_unique<QenTcpInstrument>();
  ASSERT_EQ(mOther->Connect("127.0.0.1", sSim->Port()), 0);
  ASSERT_EQ(mOther->Call(":QEN:INST:HAND:CRE? _O,\"PSX\",\"O\"", mOtherHandle), 0);
}

void GuiSimFixture::TearDown() {
  Control(":TEST:LOCK OFF");
  mOther.reset();
  uiapp::EndPolling();
  ErrorJournal::Uninstall();
  ConditionList list;
  uiapp::End(list);
  Toolkit::Install(nullptr);
  WidgetClassTable::UnregisterAll();
}

void GuiSimFixture::MakeSegment(const Dstring& name, long length, long width) {
  SegmentProperties segment;
  segment.name = name;
  segment.length = length;
  segment.width = width;
  unsigned created = 0;
  ASSERT_EQ(QenSegmentPool::Create(segment, created, mList), 0) << mList.ToText();
}

Dstring GuiSimFixture::Other(const Dstring& rest) {
  Dstring reply;
  EXPECT_EQ(mOther->Call(":" + mOtherHandle + rest, reply), 0) << rest;
  return reply;
}

double GuiSimFixture::OtherNumber(const Dstring& header) { return std::stod(Other(header + "?")); }

void GuiSimFixture::Control(const Dstring& cmd) {
  Dstring ignored;
  if (mOther) {
    EXPECT_EQ(mOther->Call(cmd, ignored), 0) << cmd;
  }
}

void GuiSimFixture::Poll() {
  uiapp::AsyncAlarmProc(nullptr);
  if (uiapp::IsSyncAlarmPending()) uiapp::SyncTimeOut();
  QCoreApplication::processEvents();
}

std::unique_ptr<MainWin> GuiSimFixture::ShowMainWin() {
  auto win = std::make_unique<MainWin>();
  win->Attach();
  win->show();
  QApplication::setActiveWindow(win.get());
  return win;
}
