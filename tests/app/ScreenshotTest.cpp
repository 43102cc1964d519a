#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <string>

#include "common/HostProcess.h"
#include "common/SimProcess.h"

namespace {

// The width and height in a PNG's header.
bool PngSize(const std::string& path, unsigned& width, unsigned& height) {
  std::ifstream in(path, std::ios::binary);
  unsigned char head[24] = {};
  if (!in.read(reinterpret_cast<char*>(head), sizeof head) || head[1] != 'P' || head[2] != 'N' || head[3] != 'G') {
    return false;
  }
  width = (head[16] << 24) | (head[17] << 16) | (head[18] << 8) | head[19];
  height = (head[20] << 24) | (head[21] << 16) | (head[22] << 8) | head[23];
  return true;
}

}  // namespace

TEST(ScreenshotTest, WritesTheMainWindowWithTheWindowsAsked) {
  SimProcess sim;
  ASSERT_NE(sim.Port(), 0);
  const std::string file = testing::TempDir() + "qengui-shot-" + std::to_string(::getpid()) + ".png";
  HostProcess host({"--log-dir", testing::TempDir(), "127.0.0.1:" + std::to_string(sim.Port()), "--screenshot", file,
                    "--open", "paramedit.ParamEd", "--open", "error.ErrorWin", "--size", "900x600"});
  ASSERT_EQ(host.WaitForExit(60000), 0) << host.Output();
  unsigned width = 0, height = 0;
  ASSERT_TRUE(PngSize(file, width, height));
  EXPECT_EQ(width, 900u);
  EXPECT_EQ(height, 600u);
  std::filesystem::remove(file);
}

TEST(ScreenshotTest, AnUnknownWindowFailsAndAWrongServerIsNamed) {
  SimProcess sim;
  const std::string file = testing::TempDir() + "qengui-shot-bad.png";
  HostProcess unknown({"127.0.0.1:" + std::to_string(sim.Port()), "--screenshot", file, "--open", "no.Such"});
  EXPECT_EQ(unknown.WaitForExit(60000), 1);
  EXPECT_NE(unknown.Output().find("no.Such"), std::string::npos) << unknown.Output();
}
