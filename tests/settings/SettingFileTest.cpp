#include "SimClientFixture.h"
#include "settings/OpenSettingDs.h"
#include "settings/SettingFile.h"
#include "settings/SettingMRU.h"

namespace {

class SettingFileTest : public SimClientFixture {};

}  // namespace

TEST_F(SettingFileTest, SavedSettingsAreListedOpenedAndRecorded) {
  SettingMRU mru;
  OpenSettingDs setting;
  ASSERT_EQ(setting.Save("Eye 10G", mru, mList), 0) << mList.ToText();
  ASSERT_EQ(setting.Save("alpha", mru, mList), 0) << mList.ToText();
  DstringList names;
  ASSERT_EQ(SettingFile::Catalogue(names, mList), 0) << mList.ToText();
  EXPECT_TRUE(names.Contains("Eye 10G"));
  EXPECT_TRUE(names.Contains("alpha"));
  EXPECT_EQ(setting.GetName(), "alpha");
  ASSERT_EQ(setting.Load("Eye 10G", false, mru, mList), 0) << mList.ToText();
  OpenSettingDs recorded;
  ASSERT_EQ(recorded.Read(mList), 0);
  EXPECT_EQ(recorded.GetName(), "Eye 10G");
  EXPECT_EQ(mru.GetNames(), (DstringList{"Eye 10G", "alpha"}));
}

TEST_F(SettingFileTest, NamesThatWouldBreakTheCommandAreRefusedBeforeSending) {
  SettingMRU mru;
  OpenSettingDs setting;
  for (const char* name : {"a\"b", "a;b", "line\nbreak", ""}) {
    ConditionList list;
    EXPECT_NE(setting.Save(name, mru, list), 0) << name;
    EXPECT_TRUE(list.HasKey("GUI_SETTING_SAVE_FAILED")) << name;
    EXPECT_GE(list.Size(), 2u) << name << ": the reason follows";
  }
  ConditionList list;
  EXPECT_NE(setting.Load("x\"", false, mru, list), 0);
  EXPECT_NE(setting.Load("nosuchsetting", false, mru, list), 0);
  EXPECT_TRUE(mru.GetNames().empty());
  EXPECT_EQ(setting.Title(), "UNTITLED");
}
