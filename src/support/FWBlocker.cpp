#include "support/FWBlocker.h"

#include "support/ConditionListLoader.h"

namespace {

FWBlocker::LockProbe* gProbe = nullptr;
const FWBlocker* gInnermost = nullptr;
int gWaiting = 0;

constexpr std::string_view kNestingByDesign[] = {"QenDs::Update", "Dte::Write"};

bool NestsByDesign(std::string_view name) {
  for (auto n : kNestingByDesign) {
    if (n == name) return true;
  }
  return false;
}

}  // namespace

FWBlocker::FWBlocker(std::string_view name, ConditionList& list) : mName(name), mList(list), mOuter(gInnermost) {
  gInnermost = this;
}

FWBlocker::~FWBlocker() { gInnermost = mOuter; }

int FWBlocker::Block() {
  if (mAsked) return mResult;
  mAsked = true;
  if (gProbe && gProbe->IsInstrumentLocked()) return mResult = kLocked;
  if (gWaiting > 0) {
    ConditionListLoader::ConditionToken(mList, "GUI_INSTRUMENT_BUSY", {Dstring(mName)}, kBusy);
    return mResult = kBusy;
  }
  if (NestsByDesign(mName)) return mResult = 0;
  for (const FWBlocker* outer = mOuter; outer; outer = outer->mOuter) {
    if (outer->mName == mName) {
      ConditionListLoader::ConditionToken(mList, "GUI_OPERATION_BUSY", {Dstring(mName)}, kBusy);
      return mResult = kBusy;
    }
  }
  return mResult = 0;
}

void FWBlocker::SetLockProbe(LockProbe* probe) { gProbe = probe; }

FWBlocker::WaitScope::WaitScope() { ++gWaiting; }

FWBlocker::WaitScope::~WaitScope() { --gWaiting; }
