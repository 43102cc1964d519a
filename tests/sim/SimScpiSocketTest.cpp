#include <gtest/gtest.h>

#include <string>

#include "ScpiSocket.h"
#include "SimScpiReader.h"
#include "SimSegment.h"

namespace {

class SimScpiSocketTest : public ::testing::Test {
 protected:
  SimScpiSocketTest() : mSim({"--test-control", "--data-dir", ::testing::TempDir() + "qensim-scpi"}) {}

  void SetUp() override {
    ASSERT_NE(mSim.ScpiPort(), 0);
    ASSERT_TRUE(mClient.Ok());
  }

  ScpiSim mSim;
  ScpiSocket mClient{mSim.ScpiPort()};
};

constexpr long kTraces = 64;
// The vectors whose 64 rows fill the largest block exactly.
constexpr long kFullVectors = SimSegment::kMaxBlockBytes * 8 / kTraces;

std::string Range(long lastVector) {
  return "0,0," + std::to_string(kTraces - 1) + "," + std::to_string(lastVector);
}

std::string Block(const std::string& bytes) {
  const std::string length = std::to_string(bytes.size());
  return "#" + std::to_string(length.size()) + length + bytes;
}

// Reads and writes take blocks up to the same size; one over it is refused at once both ways,
// and the refused query still answers, so the client does not wait out its time-out.
TEST_F(SimScpiSocketTest, ReadsAndWritesTakeTheSameLargestBlock) {
  ASSERT_EQ(mClient.Query("EDIT:SEGM:OPEN? \"big\";EDIT:SEGM1:PATT:MOD:INS 0,TRAC,BEF,64;"
                          "EDIT:SEGM1:PATT:MOD:INS 0,VECT,BEF," + std::to_string(kFullVectors + 8) +
                          ";EDIT:SEGM1:PATT:LENG?"),
            "1;" + std::to_string(kFullVectors + 8));
  std::string rows(static_cast<std::size_t>(SimSegment::kMaxBlockBytes), '\0');
  for (std::size_t i = 0; i < rows.size(); ++i) rows[i] = static_cast<char>(i * 7 + i / 65536);
  ASSERT_TRUE(mClient.Send("EDIT:SEGM1:PATT:DATA " + Range(kFullVectors - 1) + "," + Block(rows) + "\n"));
  EXPECT_EQ(mClient.Query("SYST:ERR?"), "0,\"No error\"");
  ASSERT_TRUE(mClient.Send("EDIT:SEGM1:PATT:DATA? " + Range(kFullVectors - 1) + ",BIN\n"));
  const std::string back = mClient.BlockResponse();
  EXPECT_TRUE(back == Block(rows)) << "the largest block did not come back whole (" << back.size() << " bytes)";

  // One byte a row more: a block 64 bytes over the largest.
  EXPECT_EQ(mClient.Query("EDIT:SEGM1:PATT:DATA? " + Range(kFullVectors + 7) + ",BIN", 2000), "");
  rows.append(64, '\0');
  ASSERT_TRUE(mClient.Send("EDIT:SEGM1:PATT:DATA " + Range(kFullVectors + 7) + "," + Block(rows) + "\n"));
  EXPECT_EQ(mClient.Query("SYST:ERR?;SYST:ERR?;SYST:ERR?"),
            "-222,\"Data out of range\";-222,\"Data out of range\";0,\"No error\"");
}

// A message over the input buffer is dropped whole with an error; the connection reads on.
TEST_F(SimScpiSocketTest, AnOverlongMessageIsDroppedAndTheConnectionReadsOn) {
  std::string message = "CGR1:PER? ";
  message.append(SimScpiReader::kMaxMessage, 'x');
  ASSERT_TRUE(mClient.Send(message + "\n"));
  EXPECT_EQ(mClient.Query("*IDN?").substr(0, 8), "Corvane,");
  EXPECT_EQ(mClient.Query("SYST:ERR?;SYST:ERR?"), "-363,\"Input buffer overrun\";0,\"No error\"");
}

// A client waiting in *OPC? holds up nobody else: qensim answers it when the self test ends.
TEST_F(SimScpiSocketTest, OpcQueryAnswersWhenTheSelfTestEndsAndOthersAreServedMeanwhile) {
  ScpiSocket other(mSim.ScpiPort());
  ASSERT_TRUE(mClient.Send("SYST:TEST:PACE 200;SYST:TEST:STAR;*OPC?;SYST:TEST:STAT?\n*IDN?\n"));
  EXPECT_EQ(other.Query("SYST:TEST:STAT?").substr(0, 4), "RUNN");
  EXPECT_TRUE(mClient.Silent(0)) << "answered before the self test ended";
  EXPECT_EQ(mClient.Line(), "1;DONE,5,5");
  EXPECT_EQ(mClient.Line().substr(0, 8), "Corvane,");
}

// A device clear drops the waiting message and what came after it; the next line is served.
TEST_F(SimScpiSocketTest, ADeviceClearLineEndsAWait) {
  ASSERT_TRUE(mClient.Send("SYST:TEST:PACE 60000;SYST:TEST:STAR;*WAI;*IDN?\nSYST:ERR?\n"));
  EXPECT_TRUE(mClient.Silent(50));
  EXPECT_EQ(mClient.Query("DCL\nSYST:TEST:STAT?;SYST:ERR:COUN?"), "RUNN,0,5;0");
  EXPECT_EQ(mClient.Query("SYST:TEST:ABOR;*OPC?"), "1");
}

// A block shorter than it says is cut once its bytes stop coming: the lines after it are read.
TEST_F(SimScpiSocketTest, AShortBlockIsRefusedAndDoesNotSwallowTheNextLines) {
  ASSERT_TRUE(mClient.Send("EDIT:SEGM1:PATT:DATA 0,0,7,63,#264" + std::string(10, 'x') + "\n*IDN?\n"));
  EXPECT_EQ(mClient.Line().substr(0, 8), "Corvane,");
  EXPECT_EQ(mClient.Query("SYST:ERR?;SYST:ERR?"), "-161,\"Invalid block data\";0,\"No error\"");
}

TEST_F(SimScpiSocketTest, SaveAndRecallKeepNumberedStatesAsSettings) {
  EXPECT_EQ(mClient.Query("CGR1:PER 2 ns;*SAV 9;*RST;CGR1:PER?"), "1.000000000000E-09");
  EXPECT_EQ(mClient.Query("*RCL 9;CGR1:PER?;MMEM:SETT:CAT?").substr(0, 19), "2.000000000000E-09;");
  EXPECT_EQ(mClient.Query("*SAV 10;*RCL -1;*RCL 8;SYST:ERR:ALL?"),
            "-222,\"Data out of range\",-222,\"Data out of range\",-256,\"File name not found\"");
}

}  // namespace
