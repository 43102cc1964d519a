// Every command text of the sequence model, to the byte.
#include <gtest/gtest.h>

#include "common/WireTable.h"
#include "sequences/SequenceFixture.h"

namespace {

CSequence* gSeq = nullptr;

const std::string kCentral =
    "\"PATT\",\"K2200A\",(\":CGR1:MOD1:CONN1\",\"PDAT\",\"OUTPUT_PORT\",\"K2268A\"),"
    "(\":CGR1:MOD2:CONN1\",\"PDAT\",\"INPUT_PORT\",\"K2270A\")";
const Dstring kNoEvents =
    "(3.0,(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),"
    "(\"\",0,()),(\"\",0,()))";

const WireRow kRows[] = {
    {"loop levels", [](ConditionList& l) { return CSequence::InitNumLoopLevels(l); }, {":_H:SGEN:GLOB:SEQ:LLEV?"}},
    {"read", [](ConditionList& l) { return gSeq->ReadSequence(l, 1); }, {":_H:SGEN:GLOB:SEQ?"}},
    {"write", [](ConditionList& l) { return gSeq->SetBlockLength(1, 3, l); },
     {":_H:SGEN:GLOB:SEQ " + Seq(Blk(3, "\"a\"")), ":_H:SGEN:GLOB:SEQ?"}},
    {"read and write with a central module",
     [](ConditionList& l) {
       return CPortInfo::SetConfiguration(kCentral, l) | gSeq->ReadSequence(l, 1) | gSeq->SetBlockLength(1, 3, l);
     },
     {":_H:SGEN:GLOB:SEQ:EVEN?", ":_H:SGEN:GLOB:SEQ?", ":_H:SGEN:GLOB:SEQ " + Seq(Blk(3, "\"a\"")),
      ":_H:SGEN:GLOB:SEQ:EVEN " + kNoEvents, ":_H:SGEN:GLOB:SEQ:EVEN?", ":_H:SGEN:GLOB:SEQ?"}},
    {"default segment", [](ConditionList& l) { return gSeq->SetDefaultSegment(1, 1, l); },
     {"_H:SGEN:GLOB:CONF?", ":_H:SGEN:GLOB:SEQ " + Seq(Blk(1)), ":_H:SGEN:GLOB:SEQ?"}},
};

class SequenceWire : public SequenceFixture, public testing::WithParamInterface<WireRow> {
 protected:
  void SetUp() override {
    SequenceFixture::SetUp();
    Load(Seq(Blk(1, "\"a\"")));
    gSeq = &mSeq;
  }
};

TEST_P(SequenceWire, SendsItsTextsToTheByte) { CheckWireRow(GetParam(), Inst(), mList); }

INSTANTIATE_TEST_SUITE_P(Table, SequenceWire, testing::ValuesIn(kRows), WireRowName);

}  // namespace
