#include <gtest/gtest.h>

#include <csignal>
#include <filesystem>
#include <fstream>
#include <memory>
#include <random>
#include <sstream>
#include <sys/wait.h>
#include <unistd.h>

#include "settings/FileRegistryStore.h"
#include "settings/MemoryRegistryStore.h"

namespace {

constexpr const char* kKey = "SOFTWARE\\Corvane\\Corvane 71300\\Gui";
void* Root() { return RegistryStore::CurrentUser(); }

Dstring Slurp(const Dstring& path) {
  std::ifstream in(path.c_str(), std::ios::binary);
  std::stringstream text;
  text << in.rdbuf();
  return text.str();
}

void Spill(const Dstring& path, const std::string& text) { std::ofstream(path.c_str(), std::ios::binary) << text; }

class RegistryFile : public testing::Test {
 protected:
  void SetUp() override {
    mDir = (std::filesystem::temp_directory_path() / ("qengui-registry-" + std::to_string(::getpid()))).string();
    std::filesystem::remove_all(mDir.c_str());
    mPath = mDir + "/qengui/registry";
  }
  void TearDown() override { std::filesystem::remove_all(mDir.c_str()); }
  Dstring mDir;
  Dstring mPath;
  ConditionList mList;
};

// Both stores behave alike: keys and names without regard to case, parents made on the way,
// deletes that refuse what is not there or still has keys below it.
class RegistryStores : public RegistryFile, public testing::WithParamInterface<bool> {
 protected:
  void SetUp() override {
    RegistryFile::SetUp();
    mStore = GetParam() ? std::unique_ptr<RegistryStore>(new FileRegistryStore(mPath))
                        : std::unique_ptr<RegistryStore>(new MemoryRegistryStore);
  }
  std::unique_ptr<RegistryStore> mStore;
};

}  // namespace

TEST_P(RegistryStores, KeysBehaveLikeTheRegistry) {
  RegistryStore& s = *mStore;
  ASSERT_EQ(s.Set(Root(), "A\\B\\C", "Name", "1", mList), 0);
  Dstring data;
  EXPECT_EQ(s.Query(Root(), "a\\b\\c", "NAME", data, mList), 0);
  EXPECT_EQ(data, "1");
  bool exists = false;
  EXPECT_EQ(s.HasKey(Root(), "A\\B", exists, mList), 0);
  EXPECT_TRUE(exists);
  EXPECT_EQ(s.HasValue(RegistryStore::LocalMachine(), "A\\B\\C", "Name", exists, mList), 0);
  EXPECT_FALSE(exists);
  EXPECT_TRUE(mList.IsEmpty());

  EXPECT_NE(s.DeleteKey(Root(), "A\\B", mList), 0) << "a key with keys below it stays";
  EXPECT_NE(s.DeleteValue(Root(), "A\\B\\C", "Other", mList), 0);
  EXPECT_NE(s.Query(Root(), "A\\B", "Name", data, mList), 0);
  EXPECT_NE(s.Set(Root(), "A\\\\B", "Name", "1", mList), 0);
  EXPECT_NE(s.Set(reinterpret_cast<void*>(1), "A", "Name", "1", mList), 0);
  EXPECT_EQ(mList.Size(), 5u);
  for (const Condition& c : mList) EXPECT_EQ(c.GetKey(), "GUI_REGISTRY_PROFILE_REGISTRY_ERROR");

  EXPECT_EQ(s.DeleteValue(Root(), "A\\B\\C", "name", mList), 0);
  EXPECT_EQ(s.DeleteKey(Root(), "A\\B\\C", mList), 0);
  EXPECT_EQ(s.DeleteKey(Root(), "A\\B", mList), 0);
  EXPECT_EQ(s.HasKey(Root(), "A\\B", exists, mList), 0);
  EXPECT_FALSE(exists);
}

INSTANTIATE_TEST_SUITE_P(Stores, RegistryStores, testing::Bool(),
                         [](const auto& info) { return std::string(info.param ? "File" : "Memory"); });

TEST_F(RegistryFile, FileMirrorsTheKeyTree) {
  FileRegistryStore store(mPath);
  ASSERT_EQ(store.Set(Root(), "A\\B", "n", "1i", mList), 0);
  ASSERT_EQ(store.Set(RegistryStore::LocalMachine(), "C", "=x[", "50%\nmore", mList), 0);
  EXPECT_EQ(Slurp(mPath),
            "qengui registry 1\n"
            "[HKEY_CURRENT_USER\\A]\n"
            "[HKEY_CURRENT_USER\\A\\B]\n"
            "n=1i\n"
            "[HKEY_LOCAL_MACHINE\\C]\n"
            "%3Dx%5B=50%25%0Amore\n"
            "end\n");
}

TEST_F(RegistryFile, AnyNameAndDataReadBack) {
  const std::pair<const char*, const char*> values[] = {
      {"plain", "UNTITLED"}, {"a=b", "x=y"},  {"[key]", "[v]"},   {"", "the default value"},
      {"end", "end"},        {"per%cent", "100%41"}, {"lines", "one\ntwo\r\tthree\n"}, {"\xc3\xbc", "\x7f"}};
  for (const auto& [name, data] : values) ASSERT_EQ(FileRegistryStore(mPath).Set(Root(), kKey, name, data, mList), 0);
  for (const auto& [name, data] : values) {
    Dstring back;
    EXPECT_EQ(FileRegistryStore(mPath).Query(Root(), kKey, name, back, mList), 0) << mList.ToText();
    EXPECT_EQ(back, data) << name;
  }
}

struct Damage {
  const char* label;
  const char* text;
};

class RegistryFileDamage : public RegistryFile, public testing::WithParamInterface<Damage> {};

TEST_P(RegistryFileDamage, DamagedFileIsRefusedAndLeftAlone) {
  std::filesystem::create_directories(std::filesystem::path(mPath.c_str()).parent_path());
  Spill(mPath, GetParam().text);
  FileRegistryStore store(mPath);
  Dstring data;
  EXPECT_NE(store.Query(Root(), "A", "n", data, mList), 0);
  EXPECT_NE(store.Set(Root(), "A", "n", "2", mList), 0);
  EXPECT_EQ(Slurp(mPath), GetParam().text);
  ASSERT_EQ(mList.Size(), 2u);
  EXPECT_EQ(mList[0].GetKey(), "GUI_REGISTRY_PROFILE_REGISTRY_ERROR");
}

INSTANTIATE_TEST_SUITE_P(
    Files, RegistryFileDamage,
    testing::Values(Damage{"CutShort", "qengui registry 1\n[HKEY_CURRENT_USER\\A]\nn=1\n"},
                    Damage{"CutMidLine", "qengui registry 1\n[HKEY_CURRENT_USER\\A]\nn=1\nen"},
                    Damage{"Empty", ""}, Damage{"OtherFile", "registry 1\nend\n"},
                    Damage{"BadEscape", "qengui registry 1\n[HKEY_CURRENT_USER\\A]\nn=%G1\nend\n"},
                    Damage{"ValueBeforeKey", "qengui registry 1\nn=1\nend\n"},
                    Damage{"UnknownRoot", "qengui registry 1\n[HKEY_USERS\\A]\nend\n"},
                    Damage{"EmptyElement", "qengui registry 1\n[HKEY_CURRENT_USER\\A\\\\B]\nend\n"},
                    Damage{"OpenKeyLine", "qengui registry 1\n[HKEY_CURRENT_USER\\A\nend\n"}),
    [](const auto& info) { return std::string(info.param.label); });

// A writer is killed at random moments, many times over: the file must then hold the old or
// the new content whole. Large values make each write long enough to be hit in the middle.
TEST_F(RegistryFile, KilledWriterLeavesTheOldOrTheNewContent) {
  const Dstring a(200000, 'a'), b(200000, 'b');
  ASSERT_EQ(FileRegistryStore(mPath).Set(Root(), kKey, "Data", a, mList), 0);
  std::mt19937 random(20240601);
  for (int round = 0; round < 40; ++round) {
    pid_t child = ::fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
      FileRegistryStore writer(mPath);
      for (unsigned n = 0;; ++n) {
        ConditionList ignored;
        writer.Set(Root(), kKey, "Data", n % 2 ? a : b, ignored);
      }
    }
    ::usleep(random() % 30000);
    ::kill(child, SIGKILL);
    int status = 0;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFSIGNALED(status)) << "the writer stopped by itself";
    Dstring data;
    ASSERT_EQ(FileRegistryStore(mPath).Query(Root(), kKey, "Data", data, mList), 0) << mList.ToText();
    ASSERT_TRUE(data == a || data == b) << "round " << round << ": " << data.size() << " bytes";
  }
}
