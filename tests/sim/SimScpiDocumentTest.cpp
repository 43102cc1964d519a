// Every SCPI example of docs/scripting.md, run as written: a block "```scpi" holds lines
// "> message" that are sent and lines "< response" that must come back, byte for byte.
#include <gtest/gtest.h>

#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "ScpiSocket.h"

namespace {

std::vector<std::vector<std::string>> Examples() {
  std::ifstream in(QEN_SOURCE_DIR "/docs/scripting.md");
  std::vector<std::vector<std::string>> examples;
  bool inside = false;
  for (std::string line; std::getline(in, line);) {
    if (!inside && line == "```scpi") {
      inside = true;
      examples.emplace_back();
    } else if (inside && line == "```") {
      inside = false;
    } else if (inside) {
      examples.back().push_back(line);
    }
  }
  return examples;
}

TEST(SimScpiDocument, EveryExampleAnswersAsWritten) {
  const auto examples = Examples();
  ASSERT_GE(examples.size(), 4u);
  for (std::size_t n = 0; n < examples.size(); ++n) {
    ScpiSim sim({"--test-control", "--data-dir", ::testing::TempDir() + "qensim-doc" + std::to_string(n)});
    ASSERT_NE(sim.ScpiPort(), 0);
    ScpiSocket client(sim.ScpiPort());
    for (const std::string& line : examples[n]) {
      ASSERT_GE(line.size(), 2u) << "example " << n;
      if (line.starts_with("> ")) {
        ASSERT_TRUE(client.Send(line.substr(2) + "\n"));
      } else {
        ASSERT_TRUE(line.starts_with("< ")) << line;
        EXPECT_EQ(client.Line(), line.substr(2)) << "example " << n;
      }
    }
    EXPECT_EQ(client.Query("SYST:ERR?"), "0,\"No error\"") << "example " << n << " left an error behind";
  }
}

}  // namespace
