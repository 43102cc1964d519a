#include "sequences/AnalyzerPortInstanceInfo.h"

AnalyzerPortInstanceInfo::AnalyzerPortInstanceInfo(const LispList& list) : PortInstanceInfo(list) {
  ReadNumber(list, 4, mDisplay);
}

void AnalyzerPortInstanceInfo::asLispList(LispList& list) const {
  PortInstanceInfo::asLispList(list);
  AppendNumber(list, mDisplay);
}
