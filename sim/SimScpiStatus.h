#pragma once

#include <cstdint>
#include <string_view>

#include "SimScpiRegister.h"
#include "support/Dstring.h"
#include "support/DstringList.h"

// The SCPI status registers of one connection, STATus:OPERation and STATus:QUEStionable, and
// their commands: `STAT:OPER[:EVEN]?`, `:COND?`, `:ENAB`, `:PTR`, `:NTR` (each with its query),
// the same under `STAT:QUES`, and `STAT:PRES`.
class SimScpiStatus {
 public:
  // Operation condition bits: the states of the instrument that take time.
  static constexpr std::uint16_t kCalibrating = 0x0001;  // a deskew
  static constexpr std::uint16_t kMeasuring = 0x0010;    // running
  static constexpr std::uint16_t kSynchronising = 0x0100;
  static constexpr std::uint16_t kSelfTest = 0x0200;
  static constexpr std::uint16_t kCapturing = 0x0400;
  // What *OPC and *WAI wait for.
  static constexpr std::uint16_t kPendingOperations = kCalibrating | kSynchronising | kSelfTest | kCapturing;
  // Questionable condition bit: the clock PLL is not locked.
  static constexpr std::uint16_t kPllUnlocked = 0x0020;
  // Status byte bits the two registers sum up in.
  static constexpr std::uint8_t kQuestionableSummary = 0x08;
  static constexpr std::uint8_t kOperationSummary = 0x80;

  // A mask value 0..max (rounded): 0, or the SCPI error of the text.
  static int ReadMask(std::string_view args, int max, int& value);

  void Sample(std::uint16_t operation, std::uint16_t questionable);
  // Runs a status command (`header` canonical); false when it is none. `error` is the SCPI
  // error it failed with, else 0.
  bool Run(const Dstring& header, std::string_view args, DstringList& replies, int& error);
  std::uint8_t SummaryBits() const;
  // *CLS: the event registers are emptied.
  void ClearEvents();

 private:
  SimScpiRegister mOperation;
  SimScpiRegister mQuestionable;
};
