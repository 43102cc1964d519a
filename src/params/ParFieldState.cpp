#include "params/ParFieldState.h"

#include <cmath>

#include "data/QenParamDs.h"
#include "instrument/QenStatus.h"
#include "params/DsBinding.h"
#include "params/ValueText.h"
#include "support/ConditionListLoader.h"

namespace {

// The server's text holds twelve decimals: a value it echoes is equal within that.
bool SameValue(double a, double b) { return std::fabs(a - b) <= 1e-11 * std::max(std::fabs(a), std::fabs(b)); }

}  // namespace

int ParFieldState::ReadValue(DsBinding& binding, ConditionList& list) {
  Dstring reply;
  if (int status = binding.Query(false, reply, list)) return status;
  if (binding.GetDs() == nullptr) return 0;
  mValueFailure.clear();
  if (ValueText::IsNoValue(reply)) {
    mNoValue = true;
    mAskPending = false;
    ShowReadFailure(binding);
    return 0;
  }
  const double value = ValueText::ReadReplyNumber(reply);
  if (std::isnan(value)) {
    ConditionListLoader::ConditionToken(list, "GUI_PARED_BAD_VALUE", {binding.GetDsName(), reply}, 1);
    mValueFailure = list.Last().GetMessage();
    ShowReadFailure(binding);
    return 1;
  }
  ShowReadFailure(binding);
  mValue = value;
  mNoValue = false;
  mLastSent = ValueText::FormatSent(value);
  if (mAskPending) {
    mAskPending = false;
    mAdjusted = !SameValue(mAsked, value);
  }
  return 0;
}

int ParFieldState::ReadUnits(DsBinding& binding, ConditionList& list) {
  if (binding.GetAttrDs() == nullptr) return 0;
  Dstring reply;
  if (int status = binding.GetAttrDs()->QueryStrValue(reply, list)) return status;
  UnitsRecord read = mUnits;
  mUnitsFailure.clear();
  const std::size_t before = list.Size();
  const int status = read.Parse(reply, list);
  if (status != 0) {
    mUnitsFailure = list.Size() > before ? list.Last().GetMessage() : reply;
  } else {
    mUnits = read;
  }
  ShowReadFailure(binding);
  return status;
}

void ParFieldState::ShowReadFailure(DsBinding& binding) const {
  binding.SetReadFailure(mValueFailure.empty() ? mUnitsFailure : mValueFailure);
}

Dstring ParFieldState::DisplayText() const {
  return mNoValue ? Dstring() : ValueText::FormatDisplay(mValue, DisplayExp());
}

int ParFieldState::AdjustAndSend(const Dstring& text, int steps, DsBinding& binding, ConditionList& list) {
  mNotice.clear();
  if (text.empty()) return 0;
  const double scale = std::pow(10.0, DisplayExp());
  const double typed = ValueText::ReadLeadingNumber(text);
  const double value = typed * scale + steps * scale * mUnits.step;
  if (!std::isfinite(value)) {
    ConditionListLoader::ConditionToken(list, "GUI_PARED_BAD_NUMBER", {text}, 1);
    return 1;
  }
  const Dstring sent = ValueText::FormatSent(value);
  if (DsBinding::IsDesignMode() || binding.GetDs() == nullptr) return 0;
  if (sent == mLastSent) {
    mNotice = MakeNotice(text, value, false);
    return 0;
  }
  mLastSent = sent;
  mAsked = value;
  mAskPending = true;
  const Dstring notice = MakeNotice(text, value, true);
  const int status = binding.Write(false, sent, list);
  // A write the lock refused did nothing, and says nothing.
  if (status != QenStatus::kLocked) mNotice = notice;
  return status;
}

Dstring ParFieldState::MakeNotice(const Dstring& text, double value, bool sent) const {
  const std::size_t end = ValueText::LeadingNumberLength(text);
  const Dstring after(text.substr(end));
  Dstring ignored = after.Trimmed();
  const Dstring unit = mUnits.LabelText().Trimmed();
  if (end > 0 && (ignored.empty() || ignored == unit)) return {};
  if (ignored.empty()) ignored = after;
  const Dstring shown = ValueText::FormatDisplay(value, DisplayExp()) + (unit.empty() ? "" : " " + unit);
  Dstring notice = sent ? shown + " sent" : "nothing sent, " + shown + " is already set";
  notice += "; \"" + ignored + "\" ignored";
  if (!unit.empty()) notice += ": this field is in " + unit;
  return notice;
}

bool ParFieldState::TakeAdjusted(double& asked, double& held) {
  if (!mAdjusted) return false;
  mAdjusted = false;
  asked = mAsked;
  held = mValue;
  return true;
}
