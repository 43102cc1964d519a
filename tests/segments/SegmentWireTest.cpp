// Every command text of the segment sources, the pool and the buffer, to the byte. The open
// segment "S" has the number 3.
#include <gtest/gtest.h>

#include "SegmentFixture.h"
#include "common/WireTable.h"
#include "segments/SegmentKeywords.h"

namespace {

QenSegmentDs* gDs = nullptr;

const std::map<Dstring, WireReply> kReplies = {
    {"_H:EDIT:SEGM:OPEN? \"T\"", {"4"}},
    {"_H:EDIT:SEGM:RPAT? \"T\"", {"\"/d/T.qseg\""}},
    {"_H:EDIT:SEGM:RPAT? \"S\"", {"\"/d/S.qseg\""}},
    {"_H:EDIT:SEGM:EXIS? \"S\"", {"TRUE"}},
    {"_H:EDIT:SEGM:EXIS? \"N\"", {"FALSE"}},
    {"_H:EDIT:SEGM:CAT?", {"\"S\""}},
    {"_H:EDIT:SEGM:CRE? \"N\",PRBS", {"5"}},
    {"_H:EDIT:SEGM:OPEN? \"N\"", {"5"}},
    {"_H:EDIT:SEGM:RPAT? \"N\"", {"\"/d/N.qseg\""}},
    {"_H:EDIT:SEGM3:PATT:LENG?", {"8"}},
    {"_H:EDIT:SEGM3:PATT:WIDT?", {"2"}},
    {"_H:EDIT:SEGM3:PATT:COD?", {"\"01\""}},
    {"_H:EDIT:SEGM3:PATT:DATA? 0,0,1,7,BIN", {"#500002\x0f\xf0"}},
    {"_H:EDIT:SEGM:PATT:CLIP?", {"TRUE"}},
    {"_H:EDIT:SEGM:PATT:CLIP:WIDT?", {"1"}},
    {"_H:EDIT:SEGM:PATT:CLIP:LENG?", {"1"}},
    {"_H:EDIT:SEGM:PATT:CLIP:COD?", {"\"01\""}},
    {"_H:EDIT:SEGM3:PATT:FIND:FIRS? \"3fH\", VECT, RVS", {"1,2"}},
    {"_H:EDIT:SEGM3:PATT:FIND:NEXT? 2, 1, \"17O\", TRAC, RVS", {"1,2"}},
    {"_H:EDIT:SEGM3:PATT:FIND:PREV? 2, 1, \"101\", VECT, RVS", {"1,2"}},
    {"_H:EDIT:SEGM3:PATT:ERR:FIRS? RVS", {"1,2"}},
    {"_H:EDIT:SEGM3:PATT:ERR:NEXT? 3,100,RVS", {"1,2"}},
    {"_H:EDIT:SEGM3:PATT:ERR:PREV? 3,100,RVS", {"1,2"}},
    {"_H:EDIT:SEGM3:TYPE?", {"PRBS"}},
    {"_H:EDIT:SEGM3:PARA? \"_Polynom\"", {"(\"2^7-1\")"}},
    {"_H:EDIT:SEGM3:PARA? \"_Logic\"", {"(NORMAL)"}},
    {"_H:EDIT:SEGM3:PARA? \"_PRxSType\"", {"(EXTENDED)"}},
    {"_H:EDIT:SEGM3:PARA? \"_Which\"", {"(ZERO)"}},
    {"_H:EDIT:SEGM3:PARA? \"_Errors\"", {"(3)"}},
    {"_H:EDIT:SEGM3:PARA? \"_Density\"", {"(\"1/2\")"}},
    {"_H:EDIT:SEGM3:PARA? \"_Number\"", {"(1)"}},
    {"_H:EDIT:SEGM3:PARA? \"_ExpansionHeader\"", {"(\"a5\")"}},
    {"_H:EDIT:SEGM3:PARA? \"_FramingBytes\"", {"(\"f6\")"}},
    {"_H:EDIT:SEGM3:PARA? \"_Base\"", {"(\"16\")"}},
};

using Op = std::function<int(QenSegmentDs*, ConditionList&)>;

WireRow On(const char* operation, Op op, std::vector<Dstring> tails) {
  std::vector<Dstring> sent;
  for (const Dstring& tail : tails) sent.push_back(tail.StartsWith(":") ? Dstring("_H:EDIT:SEGM3" + tail) : tail);
  return {operation, [op](ConditionList& l) { return op(gDs, l); }, std::move(sent)};
}

template <typename T, typename F>
Op Get(F f) {
  return [f](QenSegmentDs* d, ConditionList& l) {
    T value{};
    return (d->*f)(value, l);
  };
}

const StateRange kRange(1, 2, 3, 4);

const WireRow kRows[] = {
    {"open and close",
     [](ConditionList& l) {
       QenSegmentDs* ds = QenSegmentPool::AllocDs("T");
       const int status = ds->Open(l) | ds->Close(l);
       QenSegmentPool::FreeDs(ds);
       return status;
     },
     {"_H:EDIT:SEGM:OPEN? \"T\"", "_H:EDIT:SEGM:RPAT? \"T\"", "_H:MMEM:INF? \"/d/T.qseg\"",
      "_H:EDIT:SEGM4:CLOS"}},
    {"exists",
     [](ConditionList& l) {
       bool exists = false;
       return QenSegmentPool::Exists("S", exists, l);
     },
     {"_H:EDIT:SEGM:EXIS? \"S\""}},
    {"catalogue",
     [](ConditionList& l) {
       std::vector<Dstring> names;
       return QenSegmentPool::Catalog(names, l);
     },
     {"_H:EDIT:SEGM:CAT?"}},
    {"delete by name", [](ConditionList& l) { return QenSegmentPool::Delete("S", l); }, {"_H:EDIT:SEGM:DEL \"S\""}},
    {"real path",
     [](ConditionList& l) {
       Dstring path;
       return QenSegmentPool::RealPath("S", path, l);
     },
     {"_H:EDIT:SEGM:RPAT? \"S\""}},
    {"save and close by number",
     [](ConditionList& l) { return QenSegmentPool::Save(3, l) | QenSegmentPool::Close(3, l); },
     {"_H:EDIT:SEGM3:SAVE", "_H:EDIT:SEGM3:CLOS"}},
    {"create",
     [](ConditionList& l) {
       SegmentProperties p;
       p.name = "N";
       p.type = SegmentType::kPrbs;
       p.polynomial = "2^7-1";
       unsigned created = 0;
       return QenSegmentPool::Create(p, created, l);
     },
     {"_H:EDIT:SEGM:EXIS? \"N\"", "_H:EDIT:SEGM:CRE? \"N\",PRBS", "_H:EDIT:SEGM:OPEN? \"N\"",
      "_H:EDIT:SEGM:RPAT? \"N\"", "_H:MMEM:INF? \"/d/N.qseg\"", "_H:EDIT:SEGM5:TYPE PRBS",
      "_H:EDIT:SEGM5:PARA \"_Polynom\",(\"2^7-1\")", "_H:EDIT:SEGM5:PARA \"_Logic\",(NORMAL)",
      "_H:EDIT:SEGM5:PARA \"_PRxSType\",(PURE)", "_H:EDIT:SEGM5:PARA \"_Rotating\",()",
      // The source's own close, then the save and close through the number the create gave.
      "_H:EDIT:SEGM5:CLOS", "_H:EDIT:SEGM5:SAVE", "_H:EDIT:SEGM5:CLOS"}},
    On("save", [](auto* d, auto& l) { return d->Save(l); }, {":SAVE"}),
    On("save as", [](auto* d, auto& l) { return d->SaveAs("U", l); }, {":SAVE \"U\""}),
    On("dimensions",
       [](auto* d, auto& l) {
         long n = 0;
         Dstring c;
         return d->GetLength(n, l, true) | d->GetWidth(n, l, true) | d->GetCoding(c, l, true);
       },
       {":PATT:LENG?", ":PATT:WIDT?", ":PATT:COD?"}),
    On("set coding", [](auto* d, auto& l) { return d->SetCoding("01X", l); }, {":PATT:COD \"01X\""}),
    On("convert", [](auto* d, auto& l) { return d->ConvertCoding("01", "LH", l); },
       {":PATT:MOD:CONV \"01\",\"LH\""}),
    On("set length", [](auto* d, auto& l) { return d->SetLength(4, l); },
       {":PATT:LENG?", ":PATT:MOD:DEL 0,VECT,8", ":PATT:MOD:INS 0,VECT,BEF,4"}),
    On("set width", [](auto* d, auto& l) { return d->SetWidth(3, l); },
       {":PATT:WIDT?", ":PATT:MOD:DEL 0,TRAC,2,NORM", ":PATT:MOD:INS 0,TRAC,BEF,3"}),
    On("read and write a block",
       [](auto* d, auto& l) {
         SegmentBuffer* b = nullptr;
         d->CreateBuffer(b, l);
         int status = d->SetBufferStartAndLength(b, 0, 8, l) | d->Init(b, l) | d->SetState(b, 7, 1, '1', l) |
                      d->Write(b, l);
         d->DestroyBuffer(b, l);
         return status;
       },
       {":PATT:COD?", ":PATT:LENG?", ":PATT:WIDT?", ":PATT:DATA? 0,0,1,7,BIN",
        Dstring(":PATT:DATA 0,0,1,7,#500002\x0f\xf1", 28)}),
    On("fill", [](auto* d, auto& l) { return d->ModifyFill(kRange, 1, l); }, {":PATT:MOD:FILL 1,2,3,4,1"}),
    On("invert", [](auto* d, auto& l) { return d->ModifyInvert(kRange, l); }, {":PATT:MOD:INV 1,2,3,4"}),
    On("mirror", [](auto* d, auto& l) { return d->ModifyMirror(kRange, MirrorMode::kTrace, l); },
       {":PATT:MOD:MIRR 1,2,3,4,TRAC"}),
    On("copy", [](auto* d, auto& l) { return d->ModifyCopy(kRange, l); }, {":PATT:MOD:COPY 1,2,3,4"}),
    On("clipboard",
       [](auto* d, auto& l) {
         long n = 0;
         Dstring c;
         return d->GetClipBoardWidth(n, l) | d->GetClipBoardLength(n, l) | d->GetClipBoardCoding(c, l);
       },
       {"_H:EDIT:SEGM:PATT:CLIP:WIDT?", "_H:EDIT:SEGM:PATT:CLIP:LENG?", "_H:EDIT:SEGM:PATT:CLIP:COD?"}),
    On("paste", [](auto* d, auto& l) { return d->ModifyPaste(5, 6, l); }, {":PATT:MOD:PASTE 5,6,RVS"}),
    On("insert", [](auto* d, auto& l) { return d->ModifyInsert(10, VectorTrace::kVector, InsertMode::kAfter, 4, l); },
       {":PATT:MOD:INS 10,VECT,AFT,4"}),
    On("delete",
       [](auto* d, auto& l) { return d->ModifyDelete(2, VectorTrace::kTrace, 1, DeleteMode::kNormal, l); },
       {":PATT:MOD:DEL 2,TRAC,1,NORM"}),
    On("serialise", [](auto* d, auto& l) { return d->ModifySerialize(Direction::kLsbFirst, l); },
       {":PATT:MOD:SER LSB"}),
    On("deserialise", [](auto* d, auto& l) { return d->ModifyDeserialize(8, 3, l); }, {":PATT:MOD:DES 8,3"}),
    On("find",
       [](auto* d, auto& l) {
         long v = 0, t = 0;
         return d->FindPattern(v, t, 1, 2, "3f", DataFormat::kHex, FindDirection::kFirst, VectorTrace::kVector, l) |
                d->FindPattern(v, t, 1, 2, "17", DataFormat::kOct, FindDirection::kNext, VectorTrace::kTrace, l) |
                d->FindPattern(v, t, 1, 2, "101", DataFormat::kBin, FindDirection::kPrevious, VectorTrace::kVector,
                               l);
       },
       {":PATT:FIND:FIRS? \"3fH\", VECT, RVS", ":PATT:FIND:NEXT? 2, 1, \"17O\", TRAC, RVS",
        ":PATT:FIND:PREV? 2, 1, \"101\", VECT, RVS"}),
    On("errors",
       [](auto* d, auto& l) {
         long v = 0, t = 0;
         return d->GetFirstError(v, t, l) | d->GetNextError(v, t, 100, 3, l) | d->GetPrevError(v, t, 100, 3, l);
       },
       {":PATT:ERR:FIRS? RVS", ":PATT:ERR:NEXT? 3,100,RVS", ":PATT:ERR:PREV? 3,100,RVS"}),
    On("type", [](auto* d, auto& l) { return d->SetType(SegmentType::kSfi5, l) | Get<SegmentType>(&QenSegmentDs::GetType)(d, l); },
       {":TYPE SFI5", ":TYPE?"}),
    On("generator parameters",
       [](auto* d, auto& l) {
         return d->SetPRxSPolynom("2^7-1", l) | d->SetPRxSRotating(l) | d->SetPRxSLogic(PRxSLogic::kNormal, l) |
                d->SetPRxSErrors(3, l) | d->SetPRxSDensity(PRxSDensity::k1of2, l) |
                d->SetPRxSSubType(PRxSSubType::kExtendedZero, l) | d->SetPRxSExtensionNumber(1, l);
       },
       {":PARA \"_Polynom\",(\"2^7-1\")", ":PARA \"_Rotating\",()", ":PARA \"_Logic\",(NORMAL)",
        ":PARA \"_Errors\",(3)", ":PARA \"_Density\",(\"1/2\")", ":PARA \"_PRxSType\",(EXTENDED)",
        ":PARA \"_Which\",(ZERO)", ":PARA \"_Number\",(1)"}),
    On("generator parameter queries",
       [](auto* d, auto& l) {
         return Get<Dstring>(&QenSegmentDs::GetPRxSPolynom)(d, l) | Get<PRxSLogic>(&QenSegmentDs::GetPRxSLogic)(d, l) |
                Get<PRxSSubType>(&QenSegmentDs::GetPRxSSubType)(d, l) | Get<long>(&QenSegmentDs::GetPRxSErrors)(d, l) |
                Get<PRxSDensity>(&QenSegmentDs::GetPRxSDensity)(d, l) |
                Get<long>(&QenSegmentDs::GetPRxSExtensionNumber)(d, l);
       },
       {":PARA? \"_Polynom\"", ":PARA? \"_Logic\"", ":PARA? \"_PRxSType\"", ":PARA? \"_Which\"", ":PARA? \"_Errors\"",
        ":PARA? \"_Density\"", ":PARA? \"_Number\""}),
    On("SFI5 headers",
       [](auto* d, auto& l) {
         Dstring a, b;
         long n = 0;
         return d->SetSFI5Headers("a5", "f6", 16, l) | d->GetSFI5Headers(a, b, n, l);
       },
       {":PARA \"_Base\",(\"16\")", ":PARA \"_ExpansionHeader\",(\"a5\")", ":PARA \"_FramingBytes\",(\"f6\")",
        ":PARA? \"_ExpansionHeader\"", ":PARA? \"_FramingBytes\"", ":PARA? \"_Base\""}),
};

class SegmentWire : public SegmentFixture, public testing::WithParamInterface<WireRow> {
 protected:
  void SetUp() override {
    SegmentFixture::SetUp();
    gDs = OpenSegment();
  }
  void TearDown() override {
    gDs->Release();
    SegmentFixture::TearDown();
  }
};

TEST_P(SegmentWire, SendsItsTextsToTheByte) { CheckWireRow(GetParam(), Inst(), kReplies, mList); }

INSTANTIATE_TEST_SUITE_P(Table, SegmentWire, testing::ValuesIn(kRows), WireRowName);

}  // namespace
