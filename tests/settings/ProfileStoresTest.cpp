#include <cfloat>
#include <climits>
#include <functional>
#include <type_traits>

#include "SimClientFixture.h"
#include "settings/FileRegistryStore.h"
#include "settings/QENSystemProfile.h"
#include "settings/RegistryStore.h"
#include "support/ParserExpression.h"

// Every typed value through every store: the setting profile (written, forgotten, read back
// from qensim), the system profile on qensim, and the registry in memory and in its file.
namespace {

enum class Where { kSetting, kSystem, kRegistryMemory, kRegistryFile };
constexpr const char* kKey = "SOFTWARE\\Corvane\\Corvane 71300\\Gui\\Test";

template <typename T>
int Put(Where where, const Dstring& name, const T& value, ConditionList& list) {
  switch (where) {
    case Where::kSetting:
      if (int status = QENSettingProfile::SetValue(name, value, list)) return status;
      return QENSettingProfile::Write(list);
    case Where::kSystem:
      return QENSystemProfile::SetValue(name, value, list);
    default:
      return QENRegistryProfile::SetValue(RegistryStore::CurrentUser(), kKey, name, value, list);
  }
}

template <typename T>
int Get(Where where, const Dstring& name, T& value, ConditionList& list) {
  switch (where) {
    case Where::kSetting:
      QENSettingProfile::End();
      QENSettingProfile::Init(nullptr);
      if (int status = QENSettingProfile::Read(list)) return status;
      return QENSettingProfile::GetValue(name, value, list);
    case Where::kSystem:
      return QENSystemProfile::GetValue(name, value, list);
    default:
      return QENRegistryProfile::GetValue(RegistryStore::CurrentUser(), kKey, name, value, list);
  }
}

int Exists(Where where, const Dstring& name, int& exists, ConditionList& list) {
  switch (where) {
    case Where::kSetting:
      return QENSettingProfile::Exists(name, exists, list);
    case Where::kSystem:
      return QENSystemProfile::Exists(name, exists, list);
    default:
      return QENRegistryProfile::Exists(RegistryStore::CurrentUser(), kKey, name, exists, list);
  }
}

// By Where, the registry's for both registry stores.
constexpr const char* kUnexpectedKey[] = {"GUI_SETTING_PROFILE_UNEXPEXPECTED_VALUE",
                                          "GUI_SYSTEM_PROFILE_UNEXPEXPECTED_VALUE",
                                          "GUI_REGISTRY_PROFILE_UNEXPEXPECTED_VALUEDATA",
                                          "GUI_REGISTRY_PROFILE_UNEXPEXPECTED_VALUEDATA"};

template <typename T>
T Parsed(const char* text) {
  T out;
  ConditionList ignored;
  ParserExpression::Parse(text, out, ignored);
  return out;
}

// A value of one type: it is stored and read back equal, and asking for it as the `Other`
// type is refused with the store's key (not asked when `Other` is text: any value reads as text
// in the setting profile and the registry).
struct TypedCase {
  const char* name;
  std::function<void(Where, ConditionList&)> run;
};

template <typename T, typename Other>
TypedCase Case(const char* name, T value, Other) {
  return {name, [name, value](Where where, ConditionList& list) {
            ASSERT_EQ(Put(where, name, value, list), 0) << list.ToText();
            T back{};
            ASSERT_EQ(Get(where, name, back, list), 0) << list.ToText();
            EXPECT_EQ(back, value);
            int exists = 0;
            EXPECT_EQ(Exists(where, name, exists, list), 0);
            EXPECT_EQ(exists, 1);
            if constexpr (!std::is_same_v<Other, Dstring>) {
              Other other{};
              EXPECT_NE(Get(where, name, other, list), 0);
              EXPECT_TRUE(list.HasKey(kUnexpectedKey[static_cast<int>(where)])) << list.ToText();
            }
          }};
}

const TypedCase kCases[] = {
    Case("LongLowest", LONG_MIN, 0.0),
    Case("LongNegative", -5L, 0UL),
    Case("UnsignedHighest", ULONG_MAX, 0L),
    Case("FloatSmallest", FLT_MIN, 0.0),
    Case("FloatTenth", 0.1f, 0.0),
    Case("DoubleNanoseconds", 1.5e-9, 0.0f),
    Case("DoubleDenormal", 4.9406564584124654e-324, 0L),
    Case("Text", Dstring("a, (b) \"c\"; d"), Dstring()),
    Case("Words", Dstring("plain words"), 0L),
    Case("Parcel", Parsed<DataParcel>("1i,\"x,y\",2.5d"), 0.0),
    Case("List", Parsed<LispList>("\"x\",(1i,\"two, (2)\")"), DataParcel{}),
};

class TypedRoundTrip : public SimClientFixture, public testing::WithParamInterface<std::tuple<Where, TypedCase>> {
 protected:
  void SetUp() override {
    SimClientFixture::SetUp();
    if (std::get<0>(GetParam()) == Where::kRegistryFile) QENRegistryProfile::SetStore(&mFile);
  }
  FileRegistryStore mFile{sDataDir + "/registry"};
};

std::string CaseName(const testing::TestParamInfo<std::tuple<Where, TypedCase>>& info) {
  constexpr const char* kWhere[] = {"Setting", "System", "RegistryMemory", "RegistryFile"};
  return std::string(kWhere[static_cast<int>(std::get<0>(info.param))]) + std::get<1>(info.param).name;
}

}  // namespace

TEST_P(TypedRoundTrip, StoredValueReadsBackOfItsOwnTypeOnly) {
  std::get<1>(GetParam()).run(std::get<0>(GetParam()), mList);
}

INSTANTIATE_TEST_SUITE_P(Stores, TypedRoundTrip,
                         testing::Combine(testing::Values(Where::kSetting, Where::kSystem, Where::kRegistryMemory,
                                                          Where::kRegistryFile),
                                          testing::ValuesIn(kCases)),
                         CaseName);
