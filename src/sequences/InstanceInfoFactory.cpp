#include "sequences/InstanceInfoFactory.h"

#include "sequences/AnalyzerPortInstanceInfo.h"
#include "sequences/ParamInstanceInfo.h"
#include "sequences/PortInstanceInfo.h"

namespace {

struct Maker {
  const char* tag;
  std::unique_ptr<InstanceInfo> (*make)(const LispList&);
};

template <typename Record>
std::unique_ptr<InstanceInfo> Make(const LispList& list) {
  return std::make_unique<Record>(list);
}

// Compared in this order; the segment and sequence records are deliberately missing.
constexpr Maker kMakers[] = {
    {"InstanceInfo", &Make<InstanceInfo>},
    {"PortInstanceInfo", &Make<PortInstanceInfo>},
    {"AnalyzerPortInstanceInfo", &Make<AnalyzerPortInstanceInfo>},
    {"ParamInstanceInfo", &Make<ParamInstanceInfo>},
};

}  // namespace

std::unique_ptr<InstanceInfo> NDTools::InstanceInfoFactory(const LispList* list) {
  if (list == nullptr || !list->IsList() || list->Size() == 0 || !(*list)[0].IsItem()) return nullptr;
  const std::string_view tag = (*list)[0].GetItem().GetText();
  for (const Maker& maker : kMakers) {
    if (tag == maker.tag) return maker.make(*list);
  }
  return nullptr;
}
