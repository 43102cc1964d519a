#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <regex>
#include <set>
#include <sstream>

#include "support/ConditionListLoader.h"
#include "support/MessageCatalogue.h"

TEST(MessageCatalogue, ArgumentsArePlacedByNumber) {
  EXPECT_EQ(MessageCatalogue::Expand("a %2 b %1 %% %9 %", {"x", "y"}), "a y b x %  %");
  ConditionList list;
  ConditionListLoader::ConditionToken(list, "GUI_SEQUENCE_WRONG_VERSION", {"3.5"}, 1);
  ASSERT_EQ(list.Size(), 1u);
  EXPECT_EQ(list[0].GetMessage(), "The sequence has version 3.5; this program reads versions up to 3.0.");
  EXPECT_EQ(list[0].GetKey(), "GUI_SEQUENCE_WRONG_VERSION");
  EXPECT_EQ(list[0].GetCode(), 1);
  EXPECT_TRUE(list.HasKey("GUI_SEQUENCE_WRONG_VERSION"));
}

TEST(MessageCatalogue, UnknownKeyStillReportsItsArguments) {
  ConditionList list;
  ConditionListLoader::ConditionToken(list, "GUI_NOT_A_KEY", {"a", "b"});
  EXPECT_EQ(list[0].GetMessage(), "GUI_NOT_A_KEY a b");
}

// Every key written in the program must have a text, or users see a bare key.
TEST(MessageCatalogue, EveryKeyInTheSourcesHasAText) {
  const std::regex key("\"(GUI_[A-Z0-9_]+)\"");
  std::set<std::string> missing;
  int files = 0;
  for (const char* dir : {"src", "app", "sim"}) {
    std::filesystem::path root = std::filesystem::path(QEN_SOURCE_DIR) / dir;
    if (!std::filesystem::exists(root)) continue;
    for (const auto& entry : std::filesystem::recursive_directory_iterator(root)) {
      if (!entry.is_regular_file()) continue;
      std::ifstream in(entry.path());
      std::stringstream text;
      text << in.rdbuf();
      std::string all = text.str();
      ++files;
      for (std::sregex_iterator it(all.begin(), all.end(), key), end; it != end; ++it) {
        if (!MessageCatalogue::Find((*it)[1].str())) missing.insert((*it)[1].str());
      }
    }
  }
  EXPECT_GT(files, 10);
  EXPECT_TRUE(missing.empty()) << "first key without a text: " << (missing.empty() ? "" : *missing.begin());
}

TEST(MessageCatalogue, TextsAreRealSentences) {
  for (const auto& k : MessageCatalogue::Keys()) {
    const Dstring* text = MessageCatalogue::Find(k);
    ASSERT_NE(text, nullptr);
    EXPECT_GT(text->size(), 20u) << k;
    EXPECT_EQ(text->find("GUI_"), Dstring::npos) << k;
  }
}
