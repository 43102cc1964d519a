#include "sequences/CPortInfo.h"

#include "data/DirtyFlagDs.h"
#include "instrument/QenGuiInst.h"
#include "sequences/SequenceService.h"
#include "support/ConditionListLoader.h"
#include "support/LispList.h"
#include "support/ParserExpression.h"

DirtyFlagDs* CPortInfo::mDirtyFlag = nullptr;
CPortInfo::ChangeProc CPortInfo::mOnChange = nullptr;
void* CPortInfo::mChangeClient = nullptr;
bool CPortInfo::mKnown = false;
bool CPortInfo::mUntold = false;
Dstring CPortInfo::mMode;
Dstring CPortInfo::mCentral;
std::vector<CPortInfo::Port> CPortInfo::mPorts;

namespace {

bool Text(const LispList& e, Dstring& out) {
  if (!e.IsItem() || !e.GetItem().IsText()) return false;
  out = Dstring(e.GetItem().GetText());
  return true;
}

}  // namespace

void CPortInfo::Init(DirtyFlagDs* dirtyFlag, ChangeProc onChange, void* client) {
  End();
  mDirtyFlag = dirtyFlag;
  mOnChange = onChange;
  mChangeClient = client;
  if (mDirtyFlag) mDirtyFlag->RegisterProc(&CPortInfo::DirtyFlagProc, &CPortInfo::DirtyFlagMatch, nullptr);
}

void CPortInfo::End() {
  if (mDirtyFlag) mDirtyFlag->UnregisterProc(&CPortInfo::DirtyFlagProc, &CPortInfo::DirtyFlagMatch, nullptr);
  mDirtyFlag = nullptr;
  mOnChange = nullptr;
  mChangeClient = nullptr;
  Invalidate();
}

CSequence* CPortInfo::GetSequence() {
  return SequenceService::GetSequence();
}

int CPortInfo::Fetch(ConditionList& cond) {
  Dstring reply;
  const Dstring cmd = Dstring::Format("%s:SGEN:GLOB:CONF?", QenGuiInst::GetAppHandle().c_str());
  if (int status = QenGuiInst::Call(cmd, reply, cond)) return status;
  return SetConfiguration(reply.Trimmed(), cond);
}

int CPortInfo::Update(ConditionList& cond) {
  if (int status = Fetch(cond)) return status;
  if (!mUntold) return 0;
  mUntold = false;
  return mOnChange ? mOnChange(mChangeClient, cond) : 0;
}

int CPortInfo::SetConfiguration(const Dstring& reply, ConditionList& cond) {
  ConditionList parse;
  LispList top;
  Dstring mode, central;
  std::vector<Port> ports;
  bool ok = ParserExpression::Parse(reply, top, parse) == 0 && top.Size() >= 2 && Text(top[0], mode) &&
            Text(top[1], central);
  for (std::size_t i = 2; ok && i < top.Size(); ++i) {
    const LispList& e = top[i];
    Port port;
    ok = e.IsList() && e.Size() == 4 && Text(e[0], port.path) && Text(e[1], port.portClass) &&
         Text(e[2], port.type) && Text(e[3], port.model);
    ports.push_back(std::move(port));
  }
  if (!ok) {
    ConditionListLoader::ConditionToken(cond, "GUI_PORTINFO_BAD_CONFIGURATION", {reply}, 1);
    return 1;
  }
  // Learning the configuration is no change; a known one that differs is.
  if (mKnown && (mode != mMode || central != mCentral || ports != mPorts)) mUntold = true;
  mMode = std::move(mode);
  mCentral = std::move(central);
  mPorts = std::move(ports);
  mKnown = true;
  return 0;
}

void CPortInfo::Invalidate() {
  mKnown = false;
  mUntold = false;
  mMode.clear();
  mCentral.clear();
  mPorts.clear();
}

bool CPortInfo::HasCentral() {
  if (!mKnown && QenGuiInst::IsConnectedToServer()) {
    ConditionList dropped;
    Fetch(dropped);
  }
  return !mCentral.empty();
}

unsigned long CPortInfo::GetNumPorts(const Dstring& portClass) {
  unsigned long n = 0;
  for (const Port& port : mPorts) n += port.portClass == portClass;
  return n;
}

const CPortInfo::Port* CPortInfo::FindPort(const Dstring& portClass, unsigned long port) {
  for (const Port& p : mPorts) {
    if (p.portClass == portClass && --port == 0) return &p;
  }
  return nullptr;
}

int CPortInfo::GetPortType(const Dstring& portClass, unsigned long port, Dstring& type, ConditionList& cond) {
  if (!mKnown) {
    if (int status = Fetch(cond)) return status;
  }
  const Port* found = port == 0 ? nullptr : FindPort(portClass, port);
  if (found == nullptr) {
    ConditionListLoader::ConditionToken(cond, "GUI_PORTINFO_NO_PORT",
                                        {portClass, Dstring::Format("%lu", port)}, 1);
    return 1;
  }
  type = found->type;
  return 0;
}

bool CPortInfo::NfyMatchDirtyFlag(const Dstring& name) {
  return name == "ALL" || name == Dstring::Format(":%s:SGEN:GLOB:CONF", QenGuiInst::GetAppHandle().c_str());
}

int CPortInfo::DirtyFlagProc(QenDs*, void*, ConditionList& cond) {
  return Update(cond);
}

int CPortInfo::DirtyFlagMatch(QenDs*, void*, const Dstring& name) {
  return NfyMatchDirtyFlag(name) ? 1 : 0;
}

int CPortInfo::GetSequencePorts(SequencePorts::Ask ask, SequencePorts& out, ConditionList& cond) {
  if (ask == SequencePorts::Ask::Server) {
    if (int status = Fetch(cond)) return status;
  }
  out.central = ask == SequencePorts::Ask::IfUnknown ? HasCentral() : !mCentral.empty();
  out.known = mKnown;
  out.capture = mMode.StartsWith("CAPT");
  out.dataPortTypes.clear();
  for (const Port& port : mPorts) {
    if (port.portClass == "PDAT") out.dataPortTypes.push_back(port.type);
  }
  return 0;
}
