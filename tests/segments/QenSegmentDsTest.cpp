#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <vector>

#include "SegmentFixture.h"
#include "data/DirtyFlagDs.h"
#include "data/QenDsView.h"
#include "segments/SegmentKeywords.h"
#include "segments/SegmentStatus.h"

namespace {

using Op = std::function<int(QenSegmentDs*, ConditionList&)>;

class CountingView : public QenDsView {
 public:
  int NfyViewDataUpdated(QenDs* source, ConditionList&) override {
    mKinds.push_back(static_cast<QenSegmentDs*>(source)->GetChangeKind());
    return 0;
  }
  std::vector<int> mKinds;
};

// A change: the commands it sends, in order, and the change kind its views are told.
struct ChangeCase {
  const char* what;
  Op op;
  std::vector<const char*> tails;
  int kind;
};

class Changes : public SegmentFixture, public testing::WithParamInterface<ChangeCase> {};

TEST_P(Changes, SendTheirCommandsAndTellTheViews) {
  const ChangeCase& c = GetParam();
  QenSegmentDs* ds = OpenSegment();
  CountingView view;
  ds->RegisterView(&view, mList);
  // Queries among them (the current length or width) answer 4.
  for (const char* tail : c.tails) Inst().Expect(Seg(tail), Dstring(tail).EndsWith("?") ? "4" : "");
  EXPECT_EQ(c.op(ds, mList), 0) << mList.ToText();
  EXPECT_EQ(view.mKinds, std::vector<int>{c.kind}) << c.what;
  EXPECT_TRUE(ds->IsDirty());
  ds->UnregisterView(&view, mList);
  ds->Release();
}

const StateRange kRange(1, 2, 3, 4);

INSTANTIATE_TEST_SUITE_P(
    Table, Changes,
    testing::Values(
        ChangeCase{"fill",
                   [](auto* d, auto& l) { return d->ModifyFill(kRange, 1, l); },
                   {":PATT:MOD:FILL 1,2,3,4,1"},
                   QenSegmentDs::kStatesChanged},
        ChangeCase{"invert",
                   [](auto* d, auto& l) { return d->ModifyInvert(kRange, l); },
                   {":PATT:MOD:INV 1,2,3,4"},
                   QenSegmentDs::kStatesChanged},
        ChangeCase{"mirror",
                   [](auto* d, auto& l) { return d->ModifyMirror(kRange, MirrorMode::kVector, l); },
                   {":PATT:MOD:MIRR 1,2,3,4,VECT"},
                   QenSegmentDs::kStatesChanged},
        ChangeCase{"paste",
                   [](auto* d, auto& l) { return d->ModifyPaste(5, 6, l); },
                   {":PATT:MOD:PASTE 5,6,RVS"},
                   QenSegmentDs::kStatesChanged},
        ChangeCase{"insert",
                   [](auto* d, auto& l) {
                     return d->ModifyInsert(10, VectorTrace::kVector, InsertMode::kAfter, 4, l);
                   },
                   {":PATT:MOD:INS 10,VECT,AFT,4"},
                   QenSegmentDs::kLengthChanged},
        ChangeCase{"delete",
                   [](auto* d, auto& l) {
                     return d->ModifyDelete(2, VectorTrace::kTrace, 1, DeleteMode::kClear, l);
                   },
                   {":PATT:MOD:DEL 2,TRAC,1,CLR"},
                   QenSegmentDs::kWidthChanged},
        ChangeCase{"serialise",
                   [](auto* d, auto& l) { return d->ModifySerialize(Direction::kMsbFirst, l); },
                   {":PATT:MOD:SER MSB"},
                   QenSegmentDs::kSerialized},
        ChangeCase{"deserialise",
                   [](auto* d, auto& l) { return d->ModifyDeserialize(8, 3, l); },
                   {":PATT:MOD:DES 8,3"},
                   QenSegmentDs::kSerialized},
        ChangeCase{"coding",
                   [](auto* d, auto& l) { return d->SetCoding("01X", l); },
                   {":PATT:COD \"01X\""},
                   QenSegmentDs::kCodingChanged},
        ChangeCase{"convert",
                   [](auto* d, auto& l) { return d->ConvertCoding("01", "LH", l); },
                   {":PATT:MOD:CONV \"01\",\"LH\""},
                   QenSegmentDs::kCodingChanged},
        ChangeCase{"type 0 is memory",
                   [](auto* d, auto& l) { return d->SetType(SegmentType::kNone, l); },
                   {":TYPE MEM"},
                   QenSegmentDs::kTypeChanged},
        ChangeCase{"polynomial",
                   [](auto* d, auto& l) { return d->SetPRxSPolynom("2^7-1", l); },
                   {":PARA \"_Polynom\",(\"2^7-1\")"},
                   QenSegmentDs::kTypeChanged},
        ChangeCase{"logic",
                   [](auto* d, auto& l) { return d->SetPRxSLogic(PRxSLogic::kInverted, l); },
                   {":PARA \"_Logic\",(INVERTED)"},
                   QenSegmentDs::kTypeChanged},
        ChangeCase{"extended ones",
                   [](auto* d, auto& l) { return d->SetPRxSSubType(PRxSSubType::kExtendedOne, l); },
                   {":PARA \"_PRxSType\",(EXTENDED)", ":PARA \"_Which\",(ONE)"},
                   QenSegmentDs::kTypeChanged},
        ChangeCase{"errors",
                   [](auto* d, auto& l) { return d->SetPRxSErrors(5, l); },
                   {":PARA \"_Errors\",(5)"},
                   QenSegmentDs::kTypeChanged},
        ChangeCase{"density",
                   [](auto* d, auto& l) { return d->SetPRxSDensity(PRxSDensity::k1of4, l); },
                   {":PARA \"_Density\",(\"1/4\")"},
                   QenSegmentDs::kTypeChanged},
        ChangeCase{"extension",
                   [](auto* d, auto& l) { return d->SetPRxSExtensionNumber(3, l); },
                   {":PARA \"_Number\",(3)"},
                   QenSegmentDs::kTypeChanged},
        ChangeCase{"rotating",
                   [](auto* d, auto& l) { return d->SetPRxSRotating(l); },
                   {":PARA \"_Rotating\",()"},
                   QenSegmentDs::kTypeChanged},
        ChangeCase{"sfi5",
                   [](auto* d, auto& l) { return d->SetSFI5Headers("a5", "f628", 16, l); },
                   {":PARA \"_Base\",(\"16\")", ":PARA \"_ExpansionHeader\",(\"a5\")",
                    ":PARA \"_FramingBytes\",(\"f628\")"},
                   QenSegmentDs::kTypeChanged},
        // Not a resize: all of it goes, the new count comes, even when it is the same.
        ChangeCase{"length",
                   [](auto* d, auto& l) { return d->SetLength(4, l); },
                   {":PATT:LENG?", ":PATT:MOD:DEL 0,VECT,4", ":PATT:MOD:INS 0,VECT,BEF,4"},
                   QenSegmentDs::kLengthChanged},
        ChangeCase{"width",
                   [](auto* d, auto& l) { return d->SetWidth(2, l); },
                   {":PATT:WIDT?", ":PATT:MOD:DEL 0,TRAC,4,NORM", ":PATT:MOD:INS 0,TRAC,BEF,2"},
                   QenSegmentDs::kWidthChanged}),
    [](const auto& info) { return std::to_string(info.index); });

using QenSegmentDsTest = SegmentFixture;

TEST_F(QenSegmentDsTest, AChangeWritesBackFirstAndReadsAgainAfter) {
  QenSegmentDs* ds = OpenSegment();
  SegmentBuffer* buffer = Load(ds, "01", 9, 1, 0, 9, std::string(2, '\0'));
  ds->SetState(buffer, 1, 0, '1', mList);
  Inst().Expect(Seg(":PATT:DATA 0,0,0,8,") + Block(std::string("\x40\x00", 2)), "");
  Inst().Expect(Seg(":PATT:MOD:INV 0,0,0,8"), "");
  Inst().Expect(Seg(":PATT:DATA? 0,0,0,8,BIN"), Block(std::string("\xbf\x80", 2)));
  ASSERT_EQ(ds->ModifyInvert(StateRange(0, 0, 0, 8), mList), 0);
  char state = 0;
  ds->GetState(buffer, 1, 0, state, mList);
  EXPECT_EQ(state, '0');
  EXPECT_EQ(ds->GetLastModifiedRange(), StateRange(0, 0, 0, 8));
  // Inserting changes dimensions: they are read again, and the window stays inside.
  Inst().Expect(Seg(":PATT:MOD:DEL 0,VECT,5,NORM"), "");
  ExpectDimension("01", 4, 1);
  Inst().Expect(Seg(":PATT:DATA? 0,0,0,3,BIN"), Block("\xb0"));
  ASSERT_EQ(ds->ModifyDelete(0, VectorTrace::kVector, 5, DeleteMode::kNormal, mList), 0);
  EXPECT_EQ(ds->GetBufferLength(buffer), 4);
  long length = 0;
  EXPECT_EQ(ds->GetLength(length, mList), 0);  // from the buffer, nothing sent
  EXPECT_EQ(length, 4);
  ds->Release();
}

struct QueryCase {
  const char* what;
  std::function<int(QenSegmentDs*, long&, long&, ConditionList&)> op;
  const char* tail;
  const char* reply;
  long vector, trace;
};

class Searches : public SegmentFixture, public testing::WithParamInterface<QueryCase> {};

TEST_P(Searches, SendTraceThenVectorAndReadTraceThenVector) {
  const QueryCase& c = GetParam();
  QenSegmentDs* ds = OpenSegment();
  Inst().Expect(Seg(c.tail), c.reply);
  long vector = 0, trace = 0;
  EXPECT_EQ(c.op(ds, vector, trace, mList), 0) << mList.ToText();
  EXPECT_EQ(vector, c.vector) << c.what;
  EXPECT_EQ(trace, c.trace) << c.what;
  ds->Release();
}

INSTANTIATE_TEST_SUITE_P(
    Table, Searches,
    testing::Values(
        QueryCase{"first hex",
                  [](auto* d, long& v, long& t, auto& l) {
                    return d->FindPattern(v, t, 9, 9, "3f", DataFormat::kHex, FindDirection::kFirst,
                                          VectorTrace::kVector, l);
                  },
                  ":PATT:FIND:FIRS? \"3fH\", VECT, RVS", "4,7", 7, 4},
        QueryCase{"next octal",
                  [](auto* d, long& v, long& t, auto& l) {
                    return d->FindPattern(v, t, 1, 2, "17", DataFormat::kOct, FindDirection::kNext,
                                          VectorTrace::kTrace, l);
                  },
                  ":PATT:FIND:NEXT? 2, 1, \"17O\", TRAC, RVS", "(2,30)", 30, 2},
        QueryCase{"previous binary, none",
                  [](auto* d, long& v, long& t, auto& l) {
                    return d->FindPattern(v, t, 1, 2, "1x1", DataFormat::kBin, FindDirection::kPrevious,
                                          VectorTrace::kVector, l);
                  },
                  ":PATT:FIND:PREV? 2, 1, \"1x1\", VECT, RVS", "-1,-1", -1, -1},
        QueryCase{"first error", [](auto* d, long& v, long& t, auto& l) { return d->GetFirstError(v, t, l); },
                  ":PATT:ERR:FIRS? RVS", "3,100", 100, 3},
        QueryCase{"next error",
                  [](auto* d, long& v, long& t, auto& l) { return d->GetNextError(v, t, 100, 3, l); },
                  ":PATT:ERR:NEXT? 3,100,RVS", "0,101", 101, 0},
        QueryCase{"previous error",
                  [](auto* d, long& v, long& t, auto& l) { return d->GetPrevError(v, t, 100, 3, l); },
                  ":PATT:ERR:PREV? 3,100,RVS", "1,5", 5, 1}),
    [](const auto& info) { return std::to_string(info.index); });

// A reply of the wrong shape gives its own key; nothing is taken from it.
struct BadReplyCase {
  std::vector<std::pair<const char*, const char*>> exchange;  // tail, reply
  Op op;
  const char* key;
};

class BadReplies : public SegmentFixture, public testing::WithParamInterface<BadReplyCase> {};

TEST_P(BadReplies, RaiseTheirKey) {
  const BadReplyCase& c = GetParam();
  QenSegmentDs* ds = OpenSegment();
  for (const auto& [tail, reply] : c.exchange)
    Inst().Expect(tail[0] == ':' ? Seg(tail) : Dstring(tail), reply);
  EXPECT_EQ(c.op(ds, mList), SegmentStatus::kBadReply);
  EXPECT_TRUE(mList.HasKey(c.key)) << mList.ToText();
  ds->Release();
}

template <typename T, typename F>
Op Getter(F f) {
  return [f](QenSegmentDs* d, ConditionList& l) {
    T value{};
    return (d->*f)(value, l);
  };
}

INSTANTIATE_TEST_SUITE_P(
    Table, BadReplies,
    testing::Values(
        BadReplyCase{{{":PATT:COD?", ""}},
                     [](auto* d, auto& l) {
                       Dstring c;
                       return d->GetCoding(c, l, true);
                     },
                     "GUI_SEGMENTDS_BAD_CODING"},
        BadReplyCase{{{":PATT:LENG?", "12x"}},
                     [](auto* d, auto& l) {
                       long n;
                       return d->GetLength(n, l, true);
                     },
                     "GUI_SEGMENTDS_BAD_REPLY"},
        BadReplyCase{
            {{":TYPE?", "ROM"}}, Getter<SegmentType>(&QenSegmentDs::GetType), "GUI_SEGMENTDS_BAD_TYPE"},
        BadReplyCase{{{":PARA? \"_Polynom\"", "(7)"}},
                     Getter<Dstring>(&QenSegmentDs::GetPRxSPolynom),
                     "GUI_SEGMENTDS_BAD_PRXSPOLYNOM"},
        BadReplyCase{{{":PARA? \"_Logic\"", "(1,"}},
                     Getter<PRxSLogic>(&QenSegmentDs::GetPRxSLogic),
                     "GUI_SEGMENTDS_BAD_PRXSLOGIC"},
        BadReplyCase{{{":PARA? \"_Logic\"", "(SIDEWAYS)"}},
                     Getter<PRxSLogic>(&QenSegmentDs::GetPRxSLogic),
                     "GUI_SEGMENTDS_UNKNOWN_PRXSLOGIC"},
        BadReplyCase{{{":PARA? \"_PRxSType\"", "((PURE))"}},
                     Getter<PRxSSubType>(&QenSegmentDs::GetPRxSSubType),
                     "GUI_SEGMENTDS_BAD_PRXSSUBTYPE"},
        BadReplyCase{{{":PARA? \"_PRxSType\"", "(MIXED)"}},
                     Getter<PRxSSubType>(&QenSegmentDs::GetPRxSSubType),
                     "GUI_SEGMENTDS_UNKNOWN_PRXSSUBTYPE"},
        BadReplyCase{{{":PARA? \"_PRxSType\"", "(EXTENDED)"}, {":PARA? \"_Which\"", "()"}},
                     Getter<PRxSSubType>(&QenSegmentDs::GetPRxSSubType),
                     "GUI_SEGMENTDS_BAD_PRXSEXTENSION"},
        BadReplyCase{{{":PARA? \"_PRxSType\"", "(EXTENDED)"}, {":PARA? \"_Which\"", "(TWO)"}},
                     Getter<PRxSSubType>(&QenSegmentDs::GetPRxSSubType),
                     "GUI_SEGMENTDS_UNKNOWN_PRXSEXTENSION"},
        BadReplyCase{{{":PARA? \"_Errors\"", "(\"5\")"}},
                     Getter<long>(&QenSegmentDs::GetPRxSErrors),
                     "GUI_SEGMENTDS_BAD_PRXSERRORS"},
        BadReplyCase{{{":PARA? \"_Density\"", "(0.5)"}},
                     Getter<PRxSDensity>(&QenSegmentDs::GetPRxSDensity),
                     "GUI_SEGMENTDS_BAD_PRXSDENSITY"},
        BadReplyCase{{{":PARA? \"_Density\"", "(\"1/3\")"}},
                     Getter<PRxSDensity>(&QenSegmentDs::GetPRxSDensity),
                     "GUI_SEGMENTDS_UNKNOWN_PRXSDENSITY"},
        BadReplyCase{{{":PARA? \"_Number\"", "(-1)"}},
                     Getter<long>(&QenSegmentDs::GetPRxSExtensionNumber),
                     "GUI_SEGMENTDS_BAD_PRXSEXTENSIONNUMBER"},
        BadReplyCase{{{":PARA? \"_ExpansionHeader\"", "(1)"}},
                     [](auto* d, auto& l) {
                       Dstring a, b;
                       long n;
                       return d->GetSFI5Headers(a, b, n, l);
                     },
                     "GUI_SEGMENTDS_BAD_SFI5EXPHEADER"},
        BadReplyCase{{{":PARA? \"_ExpansionHeader\"", "(\"a5\")"}, {":PARA? \"_FramingBytes\"", "()"}},
                     [](auto* d, auto& l) {
                       Dstring a, b;
                       long n;
                       return d->GetSFI5Headers(a, b, n, l);
                     },
                     "GUI_SEGMENTDS_BAD_SFI5FRAMING"},
        BadReplyCase{{{":PARA? \"_ExpansionHeader\"", "(\"a5\")"},
                      {":PARA? \"_FramingBytes\"", "(\"f6\")"},
                      {":PARA? \"_Base\"", "(\"10\")"}},
                     [](auto* d, auto& l) {
                       Dstring a, b;
                       long n;
                       return d->GetSFI5Headers(a, b, n, l);
                     },
                     "GUI_SEGMENTDS_BAD_SFI5BASE"},
        BadReplyCase{{{":PARA? \"_ExpansionHeader\"", "(\"a5\")"},
                      {":PARA? \"_FramingBytes\"", "(\"f6\")"},
                      {":PARA? \"_Base\"", "(\"8\")"}},
                     [](auto* d, auto& l) {
                       Dstring a, b;
                       long n;
                       return d->GetSFI5Headers(a, b, n, l);
                     },
                     "GUI_SEGMENTDS_BAD_SFI5INFO"},
        BadReplyCase{{{"_H:EDIT:SEGM:PATT:CLIP:COD?", "()"}},
                     Getter<Dstring>(&QenSegmentDs::GetClipBoardCoding),
                     "GUI_SEGMENTDS_BAD_CLIPBOARDCODING"},
        BadReplyCase{{{"_H:EDIT:SEGM:PATT:CLIP?", "1"}},
                     [](auto* d, auto& l) {
                       bool p;
                       return d->IsPastePossible(0, 0, p, l);
                     },
                     "GUI_SEGMENTDS_BAD_REPLY"},
        BadReplyCase{{{":PATT:ERR:FIRS? RVS", "7"}},
                     [](auto* d, auto& l) {
                       long v, t;
                       return d->GetFirstError(v, t, l);
                     },
                     "GUI_SEGMENTDS_BAD_REPLY"}),
    [](const auto& info) { return std::to_string(info.index); });

// The coding is the first element's text, whatever the type of the item; a quoted empty text is
// a coding of no characters, a reply of no element is none.
TEST_F(QenSegmentDsTest, CodingsAnsweredInAnyItemFormAreTaken) {
  QenSegmentDs* ds = OpenSegment();
  const std::pair<const char*, const char*> cases[] = {
      {"01", "01"}, {"\"01XZ\"", "01XZ"}, {"01LH", "01LH"}, {"012,x", "012"}, {"(\"01\")", "01"}, {"((01))", nullptr}, {"", nullptr}, {"\"\"", ""}};
  for (const auto& [reply, coding] : cases) {
    Inst().Expect(Seg(":PATT:COD?"), reply);
    Dstring read = "kept";
    mList.Clear();
    EXPECT_EQ(ds->GetCoding(read, mList, true), coding ? 0 : SegmentStatus::kBadReply) << reply;
    EXPECT_EQ(read, coding ? coding : "kept") << reply;
    EXPECT_EQ(mList.HasKey("GUI_SEGMENTDS_BAD_CODING"), coding == nullptr) << reply;
  }
  Inst().Expect("_H:EDIT:SEGM:PATT:CLIP:COD?", "01");
  Dstring clip;
  EXPECT_EQ(ds->GetClipBoardCoding(clip, mList), 0);
  EXPECT_EQ(clip, "01");
  ds->Release();
}

// Every type but memory data sets the generator parameters; the pattern data is left alone.
TEST_F(QenSegmentDsTest, PropertiesOfTypeZeroSetTheGeneratorNotThePattern) {
  QenSegmentDs* ds = OpenSegment();
  SegmentProperties p;
  p.type = SegmentType::kNone;
  p.coding = "01";
  p.length = 8;
  p.width = 2;
  p.polynomial = "2^7-1";
  p.logic = PRxSLogic::kInverted;
  p.subType = PRxSSubType::kErrored;
  p.errorCount = 3;
  for (const char* tail : {":TYPE MEM", ":PARA \"_Polynom\",(\"2^7-1\")", ":PARA \"_Logic\",(INVERTED)",
                           ":PARA \"_PRxSType\",(ERRORED)", ":PARA \"_Rotating\",()", ":PARA \"_Errors\",(3)"}) {
    Inst().Expect(Seg(tail), "");
  }
  EXPECT_EQ(ds->SetProperties(p, mList), 0) << mList.ToText();
  // Stops at the first failure.
  Inst().Expect(Seg(":TYPE MEM"), "");
  Inst().Expect(Seg(":PARA \"_Polynom\",(\"2^7-1\")"), "", 1);
  ExpectErrors("-224,\"Illegal parameter value\"");
  EXPECT_EQ(ds->SetProperties(p, mList), 1);
  ds->Release();
}

// Text that would break a command is refused with nothing sent.
TEST_F(QenSegmentDsTest, TextThatWouldBreakACommandIsNeverSent) {
  QenSegmentDs* ds = OpenSegment();
  const std::vector<Op> ops = {
      [](auto* d, auto& l) { return d->SaveAs("a\"b", l); },
      [](auto* d, auto& l) { return d->SetCoding("01;X", l); },
      [](auto* d, auto& l) { return d->SetPRxSPolynom("2^7\n-1", l); },
      [](auto* d, auto& l) {
        long v, t;
        return d->FindPattern(v, t, 0, 0, "1\"", DataFormat::kBin, FindDirection::kFirst,
                              VectorTrace::kVector, l);
      },
      [](auto*, auto& l) {
        bool e;
        return QenSegmentPool::Exists("x;y", e, l);
      },
      [](auto*, auto& l) {
        SegmentProperties p;
        p.name = "a\tb";
        unsigned n;
        return QenSegmentPool::Create(p, n, l);
      },
  };
  for (const Op& op : ops) {
    mList.Clear();
    EXPECT_NE(op(ds, mList), 0);
    EXPECT_TRUE(mList.HasKey("GUI_COMMAND_BAD_TEXT")) << mList.ToText();
  }
  QenSegmentDs* bad = QenSegmentPool::AllocDs("q\"");
  EXPECT_NE(bad->Open(mList), 0);
  EXPECT_EQ(bad->GetNumber(), 0u);
  bad->Release();
  ds->Release();
}

TEST_F(QenSegmentDsTest, NestedOpensShareOneServerHandle) {
  QenSegmentDs* ds = OpenSegment("S", false);
  EXPECT_TRUE(ds->IsDirty());  // no file yet
  QenSegmentDs* second = QenSegmentPool::AllocDs("S");
  ASSERT_EQ(second, ds);
  EXPECT_EQ(second->NumRefs(), 2u);
  EXPECT_EQ(second->Open(mList), 0);  // nothing sent
  EXPECT_EQ(ds->Close(mList), 0);     // nothing sent
  Inst().Expect(Seg(":CLOS"), "", -3);
  EXPECT_EQ(ds->Close(mList), -3);
  EXPECT_EQ(ds->GetNumber(), 3u);  // still open
  Inst().Expect(Seg(":CLOS"), "");
  EXPECT_EQ(ds->Close(mList), 0);
  EXPECT_EQ(ds->GetNumber(), 0u);
  QenSegmentPool::FreeDs(second);
  QenSegmentPool::FreeDs(ds);
  EXPECT_EQ(QenSegmentPool::NumSources(), 0u);
}

TEST_F(QenSegmentDsTest, AnalyzerSegmentsAreNeverShared) {
  QenSegmentDs* a = QenSegmentPool::AllocDs("Analyzer1");
  QenSegmentDs* b = QenSegmentPool::AllocDs("Analyzer1");
  QenSegmentDs* c = QenSegmentPool::AllocDs("Analyze1");
  QenSegmentDs* d = QenSegmentPool::AllocDs("Analyze1");
  EXPECT_NE(a, b);
  EXPECT_EQ(c, d);
  EXPECT_EQ(QenSegmentPool::GetSegmentDsByName("Analyze1"), c);
  EXPECT_EQ(QenSegmentPool::NumSources(), 3u);
  for (QenSegmentDs* ds : {a, b, c, d}) QenSegmentPool::FreeDs(ds);
  EXPECT_EQ(QenSegmentPool::GetSegmentDsByName("Analyze1"), nullptr);
}

// When the properties cannot be applied, the new segment is deleted again.
TEST_F(QenSegmentDsTest, CreateLeavesNoHalfMadeSegment) {
  SegmentProperties p;
  p.name = "N";
  p.type = SegmentType::kPrbs;
  p.polynomial = "2^99-1";
  unsigned created = 0;
  Inst().Expect("_H:EDIT:SEGM:EXIS? \"N\"", "TRUE");
  Inst().Expect("_H:EDIT:SEGM:DEL \"N\"", "");
  Inst().Expect("_H:EDIT:SEGM:CRE? \"N\",PRBS", "7");
  Inst().Expect("_H:EDIT:SEGM:OPEN? \"N\"", "7");
  Inst().Expect("_H:EDIT:SEGM:RPAT? \"N\"", "\"/d/N.qseg\"");
  Inst().Expect("_H:MMEM:INF? \"/d/N.qseg\"", "1,\"x\"");
  Inst().Expect("_H:EDIT:SEGM7:TYPE PRBS", "");
  Inst().Expect("_H:EDIT:SEGM7:PARA \"_Polynom\",(\"2^99-1\")", "", 1);
  ExpectErrors("-224,\"Illegal parameter value\"");
  Inst().Expect("_H:EDIT:SEGM7:CLOS", "");
  Inst().Expect("_H:EDIT:SEGM7:CLOS", "");
  Inst().Expect("_H:EDIT:SEGM:EXIS? \"N\"", "TRUE");
  Inst().Expect("_H:EDIT:SEGM:DEL \"N\"", "");
  EXPECT_EQ(QenSegmentPool::Create(p, created, mList), 1);
  EXPECT_EQ(created, 7u);
  EXPECT_EQ(mList[0].GetCode(), -224);
  EXPECT_EQ(QenSegmentPool::NumSources(), 0u);
}

// The catalogue is a list of names: anything else is refused and the names held are kept.
TEST_F(QenSegmentDsTest, TheCatalogueTakesOnlyNames) {
  std::vector<Dstring> names;
  Inst().Expect("_H:EDIT:SEGM:CAT?", "\"a/b\",\"c\"");
  ASSERT_EQ(QenSegmentPool::Catalog(names, mList), 0);
  EXPECT_EQ(names, (std::vector<Dstring>{"a/b", "c"}));
  Inst().Expect("_H:EDIT:SEGM:CAT?", "\"a\",7");
  EXPECT_NE(QenSegmentPool::Catalog(names, mList), 0);
  EXPECT_EQ(names.size(), 2u);
  EXPECT_NE(mList.ToText().find("\"a\",7"), std::string::npos) << mList.ToText();
  Inst().Expect("_H:EDIT:SEGM:CAT?", "");
  ASSERT_EQ(QenSegmentPool::Catalog(names, mList), 0);
  EXPECT_TRUE(names.empty());
}

// A change the server reports for an open segment makes it read again and tell its views.
TEST_F(QenSegmentDsTest, TheDirtyFlagRereadsTheSegmentsItNames) {
  auto* dirty = new DirtyFlagDs;
  QenSegmentPool::End();
  QenSegmentPool::Init(dirty);
  QenSegmentDs* ds = OpenSegment();
  SegmentBuffer* buffer = Load(ds, "01", 8, 1, 0, 8, std::string(1, '\0'));
  CountingView view;
  ds->RegisterView(&view, mList);
  Inst().Expect("_H:DFL?", "\":_H:EDIT:SEGM4\",\":_H:EDIT:SEGM34\"");
  EXPECT_EQ(dirty->UpdateFromFW(mList), 0);
  Inst().Expect("_H:DFL?", "\":_H:EDIT:SEGM3\"");
  ExpectDimension("01", 8, 1);
  Inst().Expect(Seg(":PATT:DATA? 0,0,0,7,BIN"), Block("\x80"));
  EXPECT_EQ(dirty->UpdateFromFW(mList), 0);
  EXPECT_EQ(view.mKinds, std::vector<int>{QenSegmentDs::kUpdatedAll});
  char state = 0;
  ds->GetState(buffer, 0, 0, state, mList);
  EXPECT_EQ(state, '1');
  ds->UnregisterView(&view, mList);
  ds->Release();
  QenSegmentPool::End();
  dirty->Release();
}

TEST(SegmentKeywords, WordsAndTextsOfTheTypes) {
  struct Case {
    SegmentType type;
    const char *word, *text, *shortText;
  } cases[] = {{SegmentType::kNone, "MEM", "unknown", "unknown"},
               {SegmentType::kMemory, "MEM", "Pattern Data", "MEMORY"},
               {SegmentType::kSfi5, "SFI5", "Serdes Framer Interface 5", "SFI5"},
               {static_cast<SegmentType>(9), "", "unknown", "unknown"}};
  for (const Case& c : cases) {
    EXPECT_STREQ(SegmentKeywords::Word(c.type), c.word);
    EXPECT_STREQ(SegmentKeywords::DisplayText(c.type), c.text);
    EXPECT_STREQ(SegmentKeywords::ShortText(c.type), c.shortText);
  }
  SegmentType type = SegmentType::kPrws;
  EXPECT_TRUE(SegmentKeywords::From("MEM", type));
  EXPECT_EQ(type, SegmentType::kMemory);
  EXPECT_FALSE(SegmentKeywords::From("mem", type));
  EXPECT_STREQ(SegmentKeywords::DisplayText(PRxSLogic::kInverted), "Inverted");
}

TEST(ConvertBase, KeepsTheBits) {
  struct Case {
    const char* text;
    long from, to;
    const char* out;
  } cases[] = {
      {"f628", 16, 2, "1111011000101000"}, {"F628", 16, 8, "173050"}, {"101", 2, 16, "5"}, {"", 2, 16, ""}};
  ConditionList list;
  for (const Case& c : cases) {
    Dstring out;
    EXPECT_EQ(QenSegmentDs::ConvertBase(c.text, c.from, c.to, out, list), 0);
    EXPECT_EQ(out, c.out);
  }
  Dstring out = "kept";
  EXPECT_NE(QenSegmentDs::ConvertBase("12", 2, 16, out, list), 0);
  EXPECT_NE(QenSegmentDs::ConvertBase("12", 10, 16, out, list), 0);
  EXPECT_EQ(out, "kept");
}

}  // namespace
