#include "SimClientFixture.h"
#include "settings/SettingFile.h"
#include "settings/SettingMRU.h"

namespace {

class SettingFileTest : public SimClientFixture {};

}  // namespace

TEST_F(SettingFileTest, SavedSettingsAreListedOpenedAndRecorded) {
  SettingMRU mru;
  ASSERT_EQ(SettingFile::Save("Eye 10G", mru, mList), 0) << mList.ToText();
  ASSERT_EQ(SettingFile::Save("alpha", mru, mList), 0) << mList.ToText();
  DstringList names;
  ASSERT_EQ(SettingFile::Catalogue(names, mList), 0) << mList.ToText();
  EXPECT_TRUE(names.Contains("Eye 10G"));
  EXPECT_TRUE(names.Contains("alpha"));
  EXPECT_EQ(SettingFile::CurrentName(), "alpha");
  ASSERT_EQ(SettingFile::Open("Eye 10G", false, mru, mList), 0) << mList.ToText();
  EXPECT_EQ(SettingFile::CurrentName(), "Eye 10G");
  EXPECT_EQ(mru.GetNames().front(), "Eye 10G");
}

TEST_F(SettingFileTest, NamesThatWouldBreakTheCommandAreRefusedBeforeSending) {
  SettingMRU mru;
  for (const char* name : {"a\"b", "a;b", "line\nbreak", ""}) {
    ConditionList list;
    EXPECT_NE(SettingFile::Save(name, mru, list), 0) << name;
    EXPECT_FALSE(list.IsEmpty()) << name;
  }
  ConditionList list;
  EXPECT_NE(SettingFile::Open("x\"", false, mru, list), 0);
  EXPECT_NE(SettingFile::Open("nosuchsetting", false, mru, list), 0);
  EXPECT_TRUE(mru.GetNames().empty());
}
