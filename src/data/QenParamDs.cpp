#include "data/QenParamDs.h"

#include "data/Dte.h"
#include "instrument/CommandText.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "support/ConditionListLoader.h"
#include "support/DataParcel.h"
#include "support/ParserExpression.h"

namespace {

// The text of the first item when the value is a quoted string, as sub-command values are.
bool QuotedText(const Dstring& value, Dstring& text) {
  DataParcel parcel;
  ConditionList ignored;
  if (ParserExpression::Parse(value, parcel, ignored) != 0 || parcel.empty()) return false;
  if (parcel[0].GetType() != DataItemType::String) return false;
  text = Dstring(parcel[0].GetText());
  return true;
}

}  // namespace

QenParamDs::QenParamDs(const Dstring& header) : mProgramHeader(header) {}

QenParamDs::~QenParamDs() { Dte::Forget(this); }

void QenParamDs::TakeReadValue(const Dstring& value, bool clashing) {
  mValue = value;
  mClashing = clashing;
  mValid = true;
  mFailed = 0;
}

bool QenParamDs::TakeReadReply(const Dstring& reply) {
  std::vector<std::string_view> parts;
  ConditionList ignored;
  if (ParserExpression::SplitJoined(reply, parts, ignored) != 0 || parts.size() != 2) return false;
  TakeReadValue(Dstring(parts[0]), Dstring(parts[1]).Trimmed() == "1");
  return true;
}

// The value and its clash state in one round trip. A server that refuses or garbles the clash
// form still gets asked the value alone; the clash state is then unknown, and the refusal,
// which is no fault of the user's, stays out of the list. Once the value alone was read where
// the joined form failed, this parameter is asked the value alone from then on.
int QenParamDs::ReadValue(ConditionList& list) {
  Dstring reply;
  int status = QenStatus::kOk;
  if (!mClashUnknown) {
    ConditionList joined;
    status = QenGuiInst::Call(GetReadWithClashCmdStr(), reply, joined);
    if (status == QenStatus::kOk && TakeReadReply(reply)) return status;
    if (status == QenStatus::kLocked || status == QenStatus::kServerTerminated) return status;
  }
  status = QenGuiInst::Call(GetReadCmdStr(), reply, list);
  if (status == QenStatus::kOk) {
    TakeReadValue(reply, false);
    mClashUnknown = true;
  } else if (status != QenStatus::kLocked) {
    mFailed = 1;
  }
  return status;
}

int QenParamDs::QueryStrValue(Dstring& out, ConditionList& list) {
  mUsed = 1;
  if (!mValid || mValue.empty()) {
    if (int status = ReadValue(list)) return status;
  }
  Dstring text;
  if (mSubCmdEnabled && QuotedText(mValue, text)) {
    auto blank = text.find(' ');
    out = blank == Dstring::npos ? text : Dstring(text.substr(blank + 1));
  } else {
    out = mValue;
  }
  return QenStatus::kOk;
}

Dstring QenParamDs::CurrentSubCmd() const {
  Dstring text;
  if (!QuotedText(mValue, text)) return {};
  return Dstring(text.substr(0, text.find(' ')));
}

int QenParamDs::SetStrValue(const Dstring& value, ConditionList& list) {
  if (mReadOnly) {
    ConditionListLoader::ConditionToken(list, "GUI_PARAMDS_READONLY", {mProgramHeader}, 1);
    return 1;
  }
  Dstring text = value;
  if (mSubCmdEnabled) {
    if (int status = CommandText::CheckArgument(value, list)) return status;
    Dstring current;
    if (mValue.empty()) {
      if (int status = QueryStrValue(current, list)) return status;
    }
    Dstring sub = CurrentSubCmd();
    if (!sub.empty()) text = "\"" + sub + " " + value + "\"";
  } else if (int status = CommandText::CheckValue(value, list)) {
    return status;
  }
  mValue = text;
  mValid = false;
  return Dte::Write(this, list);
}

int QenParamDs::QuerySubCmd(Dstring& out, ConditionList& list) {
  Dstring ignored;
  if (int status = QueryStrValue(ignored, list)) return status;
  out = CurrentSubCmd();
  return QenStatus::kOk;
}

int QenParamDs::SetSubCmd(const Dstring& sub, ConditionList& list, const Dstring& value) {
  if (mReadOnly) {
    ConditionListLoader::ConditionToken(list, "GUI_PARAMDS_READONLY", {mProgramHeader}, 1);
    return 1;
  }
  if (int status = CommandText::CheckArgument(sub + value, list)) return status;
  mValue = value.empty() ? "\"" + sub + "\"" : "\"" + sub + " " + value + "\"";
  mValid = false;
  return Dte::Write(this, list);
}

int QenParamDs::QueryLimit(const char* which, Dstring& out, ConditionList& list) {
  mUsed = 1;
  return QenGuiInst::Call(mProgramHeader + "? " + which, out, list);
}

int QenParamDs::QueryHLimStrValue(Dstring& out, ConditionList& list) { return QueryLimit("HLIM", out, list); }
int QenParamDs::QueryLLimStrValue(Dstring& out, ConditionList& list) { return QueryLimit("LLIM", out, list); }
int QenParamDs::QueryHMaxStrValue(Dstring& out, ConditionList& list) { return QueryLimit("HMAX", out, list); }
int QenParamDs::QueryLMaxStrValue(Dstring& out, ConditionList& list) { return QueryLimit("LMAX", out, list); }

int QenParamDs::Match(const Dstring& name) { return name.ToUpper() == mProgramHeader.ToUpper(); }

int QenParamDs::NfyViewDataUpdated(QenDs*, ConditionList& list) {
  Invalidate();
  return Update(list, 0);
}
