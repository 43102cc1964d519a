#include "params/DsBinding.h"

#include "data/Dte.h"
#include "data/QenParamDs.h"
#include "instrument/QenStatus.h"
#include "support/FWBlocker.h"
#include "toolkit/WaitCursor.h"

namespace {

bool gDesignMode = false;

}  // namespace

// Tells the control when the prefix or step of its parameter changed.
class DsBinding::AttrView : public QenDsView {
 public:
  explicit AttrView(Client& client) : mClient(client) {}
  int NfyViewRegistered(QenDs*, ConditionList& list) override { return mClient.RefreshUnits(list); }
  int NfyViewDataUpdated(QenDs*, ConditionList& list) override { return mClient.RefreshUnits(list); }

 private:
  Client& mClient;
};

DsBinding::DsBinding(Client& client, std::string_view className, bool withAttrView)
    : mClient(client), mClassName(className), mAttrView(withAttrView ? new AttrView(client) : nullptr) {}

DsBinding::~DsBinding() {
  NfyEnd();
  delete mAttrView;
}

void DsBinding::SetDesignMode(bool on) { gDesignMode = on; }
bool DsBinding::IsDesignMode() { return gDesignMode; }

void DsBinding::NfyInit() {
  mInitialised = true;
  ConditionList ignored;
  Register(ignored);
}

void DsBinding::NfyEnd() {
  ConditionList ignored;
  Unregister(ignored);
  mInitialised = false;
}

int DsBinding::Register(ConditionList& list) {
  if (!mInitialised || !IsBound() || gDesignMode || mRegistered) return 0;
  mRegistered = true;
  int status = Dte::RegisterView(GetDsName(), this, list, mFlag);
  if (mAttrView != nullptr) {
    if (int attrStatus = Dte::RegisterView(GetAttrDsName(), mAttrView, list, 0); status == 0) status = attrStatus;
  }
  return status;
}

int DsBinding::Unregister(ConditionList& list) {
  if (!mRegistered) return 0;
  mRegistered = false;
  int status = Dte::UnregisterView(GetDsName(), this, list);
  if (mAttrView != nullptr) {
    if (int attrStatus = Dte::UnregisterView(GetAttrDsName(), mAttrView, list); status == 0) status = attrStatus;
  }
  return status;
}

int DsBinding::Rename(Dstring& attribute, const Dstring& text, const char* op, ConditionList& list) {
  const Dstring scope = mClassName + op;
  FWBlocker blocker(scope, list);
  if (int blocked = blocker.Block()) return blocked;
  if (attribute == text) return 0;
  if (int status = Unregister(list)) return status;
  attribute = text;
  mLastError.clear();
  mReadFailure.clear();
  return Register(list);
}

int DsBinding::SetDsBaseName(const Dstring& text, ConditionList& list) {
  return Rename(mBaseName, text, "::SetDsBaseName", list);
}

int DsBinding::SetDsCmdName(const Dstring& text, ConditionList& list) {
  return Rename(mCmdName, text, "::SetDsCmdName", list);
}

QenParamDs* DsBinding::GetDs() const {
  if (!IsBound() || gDesignMode) return nullptr;
  return Dte::GetDsByName(GetDsName());
}

QenParamDs* DsBinding::GetAttrDs() const {
  if (!IsBound() || gDesignMode) return nullptr;
  return Dte::GetDsByName(GetAttrDsName());
}

void DsBinding::NoteResult(int status, const ConditionList& list, std::size_t before) {
  if (status == QenStatus::kOk) {
    mLastError.clear();
  } else if (list.Size() > before) {
    mLastError = list.Last().GetMessage();
  }
}

int DsBinding::Query(bool subCmd, Dstring& out, ConditionList& list) {
  QenParamDs* ds = GetDs();
  if (ds == nullptr) return 0;
  const std::size_t before = list.Size();
  const int status = subCmd ? ds->QuerySubCmd(out, list) : ds->QueryStrValue(out, list);
  NoteResult(status, list, before);
  return status;
}

int DsBinding::Write(bool subCmd, const Dstring& text, ConditionList& list) {
  QenParamDs* ds = GetDs();
  if (ds == nullptr) return 0;
  const std::size_t before = list.Size();
  int status = 0;
  {
    WaitCursor wait;
    status = subCmd ? ds->SetSubCmd(text, list) : ds->SetStrValue(text, list);
  }
  NoteResult(status, list, before);
  return status;
}

bool DsBinding::IsFailed() const {
  if (!mReadFailure.empty()) return true;
  const QenParamDs* ds = GetDs();
  return ds != nullptr && ds->IsFailed() != 0;
}

bool DsBinding::IsClashing() const {
  const QenParamDs* ds = GetDs();
  return ds != nullptr && ds->IsClashing() != 0;
}

Dstring DsBinding::ToolTip() const {
  if (!IsBound()) return {};
  Dstring tip = GetDsName();
  if (!mReadFailure.empty()) {
    tip += "\n" + mReadFailure;
  } else if (IsFailed() && !mLastError.empty()) {
    tip += "\n" + mLastError;
  }
  return tip;
}

int DsBinding::NfyViewRegistered(QenDs*, ConditionList& list) { return mClient.Refresh(list); }

int DsBinding::NfyViewDataUpdated(QenDs*, ConditionList& list) { return mClient.Refresh(list); }
