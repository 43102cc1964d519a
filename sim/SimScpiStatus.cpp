#include "SimScpiStatus.h"

#include <cmath>

#include "support/ConditionList.h"
#include "support/DataParcel.h"
#include "support/ParserExpression.h"

int SimScpiStatus::ReadMask(std::string_view args, int max, int& value) {
  if (args.empty()) return -109;
  DataParcel items;
  ConditionList ignored;
  double number = 0;
  if (ParserExpression::Parse(args, items, ignored) != 0 || items.size() != 1 || !items[0].GetDouble(number)) return -104;
  number = std::round(number);
  if (!(number >= 0 && number <= max)) return -222;
  value = static_cast<int>(number);
  return 0;
}

void SimScpiStatus::Sample(std::uint16_t operation, std::uint16_t questionable) {
  mOperation.Sample(operation);
  mQuestionable.Sample(questionable);
}

bool SimScpiStatus::Run(const Dstring& header, std::string_view args, DstringList& replies, int& error) {
  error = 0;
  if (header == "STAT:PRES") {
    if (!args.empty()) error = -108;
    if (error == 0) {
      mOperation.Preset();
      mQuestionable.Preset();
    }
    return true;
  }
  SimScpiRegister* reg = header.StartsWith("STAT:OPER") ? &mOperation : header.StartsWith("STAT:QUES") ? &mQuestionable : nullptr;
  if (reg == nullptr) return false;
  const Dstring tail = header.substr(9);
  struct Field {
    const char* tail;
    std::uint16_t SimScpiRegister::*mask;
  };
  static constexpr Field kFields[] = {{":ENAB", &SimScpiRegister::mEnable},
                                      {":PTR", &SimScpiRegister::mRising},
                                      {":NTR", &SimScpiRegister::mFalling}};
  const bool query = tail.EndsWith("?");
  if (query && !args.empty()) {
    error = -108;
    return true;
  }
  if (tail == "?") {
    replies.push_back(std::to_string(reg->TakeEvent()));
    return true;
  }
  if (tail == ":COND?") {
    replies.push_back(std::to_string(reg->Condition()));
    return true;
  }
  for (const Field& f : kFields) {
    if (tail == Dstring(f.tail) + "?") {
      replies.push_back(std::to_string(reg->*f.mask));
      return true;
    }
    if (tail == f.tail) {
      int value = 0;
      error = ReadMask(args, SimScpiRegister::kMask, value);
      if (error == 0) reg->*f.mask = static_cast<std::uint16_t>(value);
      return true;
    }
  }
  error = -113;
  return true;
}

std::uint8_t SimScpiStatus::SummaryBits() const {
  return static_cast<std::uint8_t>((mOperation.Summary() ? kOperationSummary : 0) |
                                   (mQuestionable.Summary() ? kQuestionableSummary : 0));
}

void SimScpiStatus::ClearEvents() {
  mOperation.ClearEvent();
  mQuestionable.ClearEvent();
}
