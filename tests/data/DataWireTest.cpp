// Every command text of the data sources, the engine and the state sources, to the byte.
#include <gtest/gtest.h>

#include "common/InstrumentFixture.h"
#include "common/WireTable.h"
#include "data/ConnectDs.h"
#include "data/DataPortOneLockDs.h"
#include "data/DirtyFlagDs.h"
#include "data/Dte.h"
#include "data/PLLStateDs.h"
#include "data/QenParamDs.h"
#include "data/RunStopDs.h"
#include "data/SystemStateDs.h"

namespace {

const std::map<Dstring, WireReply> kReplies = {
    {":_H:SYST:ERR?", {"0,\"No error\""}},
    {":_H:A?;:_H:A? CLAS", {"1;0"}},
    {":_H:N?;:_H:N? CLAS", {"\"abc\"", 1}},
    {":_H:N?", {"\"abc\""}},
    {":_H:B?;:_H:B? CLAS", {"8;1"}},
    {":_H:K?;:_H:K? CLAS", {"\"PRBS 7\";0"}},
    {":_H:SGEN:GLOB:INIT:CONT?", {"ON"}},
    {":SR:_H:CGR@:MOD1:CONN1:PULS:DEL", {"2"}},
    {":SR:_H:CGR2:MOD@:CONN1:PULS:DEL", {"3"}},
    {":_H:CGR2:MOD3:TYPE?", {"\"K2268A\""}},
    {":_H:CGR2:MOD3:UCAS?", {"FREE"}},
};

// Runs `op` on the parameter source `name`, allocated for the row and freed after it.
WireRow Param(const char* operation, const char* name, unsigned flags,
              std::function<int(QenParamDs*, ConditionList&)> op, std::vector<Dstring> sent) {
  return {operation,
          [=](ConditionList& l) {
            QenParamDs* s = Dte::AllocDsByName(name, flags);
            const int status = op(s, l);
            Dte::FreeDs(s);
            return status;
          },
          std::move(sent)};
}

// Runs `op` on a new state source of type T.
template <typename T>
WireRow State(const char* operation, std::function<int(T*, ConditionList&)> op, std::vector<Dstring> sent) {
  return {operation,
          [=](ConditionList& l) {
            T* s = new T;
            const int status = op(s, l);
            s->Release();
            return status;
          },
          std::move(sent)};
}

int Read(QenParamDs* s, ConditionList& l) {
  Dstring v;
  return s->QueryStrValue(v, l);
}

const Dstring kBracketed = ":_H:SGEN:GLOB:INIT:CONT OFF;:_H:A 1;:_H:B 8;:_H:SGEN:GLOB:INIT:CONT ON";

const WireRow kRows[] = {
    Param("read", ":_H:A", 0, Read, {":_H:A?;:_H:A? CLAS"}),
    Param("read without the clash form", ":_H:N", 0, Read, {":_H:N?;:_H:N? CLAS", ":_H:SYST:ERR?", ":_H:N?"}),
    Param("write", ":_H:A", 0, [](auto* s, auto& l) { return s->SetStrValue("5", l); },
          {":_H:A 5", ":VC:_H:A 5", ":RC:_H:A 5"}),
    Param("limits", ":_H:A", 0,
          [](auto* s, auto& l) {
            Dstring v;
            return s->QueryHLimStrValue(v, l) | s->QueryLLimStrValue(v, l) | s->QueryHMaxStrValue(v, l) |
                   s->QueryLMaxStrValue(v, l);
          },
          {":_H:A? HLIM", ":_H:A? LLIM", ":_H:A? HMAX", ":_H:A? LMAX"}),
    Param("sub-command value", ":_H:K", Dte::kSubCmd, [](auto* s, auto& l) { return s->SetStrValue("15", l); },
          {":_H:K?;:_H:K? CLAS", ":_H:K \"PRBS 15\"", ":VC:_H:K \"PRBS 15\"", ":RC:_H:K \"PRBS 15\""}),
    Param("sub-command alone", ":_H:K", Dte::kSubCmd, [](auto* s, auto& l) { return s->SetSubCmd("MEM", l); },
          {":_H:K \"MEM\"", ":VC:_H:K \"MEM\"", ":RC:_H:K \"MEM\""}),
    Param("sub-command and value", ":_H:K", Dte::kSubCmd,
          [](auto* s, auto& l) { return s->SetSubCmd("PRBS", l, "7"); },
          {":_H:K \"PRBS 7\"", ":VC:_H:K \"PRBS 7\"", ":RC:_H:K \"PRBS 7\""}),
    Param("transaction", ":_H:A", 0,
          [](auto* s, auto& l) {
            Dte::StartTransaction();
            Dte::SendCmd(":_H:X 1", l);
            s->SetStrValue("2", l);
            return Dte::EndTransaction(l);
          },
          {":_H:X 1;:_H:A 2", ":VC:_H:X 1;:_H:A 2", ":RC:_H:X 1;:_H:A 2"}),
    Param("clashing write while running", ":_H:A", 0,
          [](auto* s, auto& l) {
            QenParamDs* clashing = Dte::AllocDsByName(":_H:B", 0);
            int status = Read(clashing, l);
            if (status == 0) status = s->SetStrValue("1", l);
            Dte::FreeDs(clashing);
            return status;
          },
          {":_H:B?;:_H:B? CLAS", ":_H:SGEN:GLOB:INIT:CONT?", kBracketed, ":VC" + kBracketed, ":RC" + kBracketed,
           ":_H:B?;:_H:B? CLAS"}),
    State<RunStopDs>("run state", [](auto* s, auto& l) { return s->UpdateFromFW(l); },
                     {"_H:SGEN:GLOB:INIT:CONT?"}),
    State<RunStopDs>("run", [](auto* s, auto& l) { return s->Run(l); }, {"_H:SGEN:GLOB:INIT:CONT ON"}),
    State<RunStopDs>("stop", [](auto* s, auto& l) { return s->Stop(l); }, {"_H:SGEN:GLOB:INIT:CONT OFF"}),
    State<SystemStateDs>("system state", [](auto* s, auto& l) { return s->UpdateFromFW(l); },
                         {"_H:SGEN:GLOB:SYST:STAT?"}),
    State<PLLStateDs>("PLL state", [](auto* s, auto& l) { return s->UpdateFromFW(l); }, {"_H:SGEN:GLOB:PLL:STAT?"}),
    State<ConnectDs>("connection state", [](auto* s, auto& l) { return s->UpdateFromFW(l); },
                     {"_H:SGEN:GLOB:CONN?"}),
    State<ConnectDs>("connect", [](auto* s, auto& l) { return s->Connect(l); }, {"_H:SGEN:GLOB:CONN ON"}),
    State<ConnectDs>("disconnect", [](auto* s, auto& l) { return s->Disconnect(l); }, {"_H:SGEN:GLOB:CONN OFF"}),
    State<DirtyFlagDs>("dirty flag", [](auto* s, auto& l) { return s->UpdateFromFW(l); }, {"_H:DFL?"}),
    State<DataPortOneLockDs>("data port 1 lock", [](auto* s, auto& l) { return s->UpdateFromFW(l); },
                             {":SR:_H:CGR@:MOD1:CONN1:PULS:DEL", ":SR:_H:CGR2:MOD@:CONN1:PULS:DEL",
                              ":_H:CGR2:MOD3:TYPE?", ":_H:CGR2:MOD3:UCAS?"}),
};

class DataWire : public InstrumentFixture, public testing::WithParamInterface<WireRow> {
 protected:
  void SetUp() override {
    InstrumentFixture::SetUp();
    Dte::Init();
  }
  void TearDown() override {
    Dte::End();
    InstrumentFixture::TearDown();
  }
};

TEST_P(DataWire, SendsItsTextsToTheByte) { CheckWireRow(GetParam(), Inst(), kReplies, mList); }

INSTANTIATE_TEST_SUITE_P(Table, DataWire, testing::ValuesIn(kRows), WireRowName);

}  // namespace
