// The instance records: equality, list forms and the factory.
#include <gtest/gtest.h>

#include <memory>

#include "sequences/AnalyzerPortInstanceInfo.h"
#include "sequences/InstanceInfoFactory.h"
#include "sequences/NDRect16.h"
#include "sequences/ParamInstanceInfo.h"
#include "sequences/SegmentPortSequenceBlockInstanceInfo.h"
#include "sequences/SequenceBlockInstanceInfo.h"
#include "sequences/SequenceInstanceInfo.h"
#include "support/ParserExpression.h"

namespace {

LispList ListOf(const InstanceInfo& record) {
  LispList list;
  list.Append(DataItem::MakeWord("left over"));
  record.asLispList(list);
  return list;
}

LispList Parsed(const char* text) {
  LispList list;
  ConditionList conditions;
  EXPECT_EQ(ParserExpression::Parse(text, list, conditions), 0) << text;
  return list;
}

TEST(InstanceInfo, EachClassNamesItself) {
  const std::unique_ptr<InstanceInfo> records[] = {std::make_unique<InstanceInfo>(),
                                                   std::make_unique<PortInstanceInfo>(),
                                                   std::make_unique<AnalyzerPortInstanceInfo>(),
                                                   std::make_unique<SegmentPortInstanceInfo>(),
                                                   std::make_unique<ParamInstanceInfo>(),
                                                   std::make_unique<SequenceInstanceInfo>(),
                                                   std::make_unique<SequenceBlockInstanceInfo>(),
                                                   std::make_unique<SegmentPortSequenceBlockInstanceInfo>()};
  const char* names[] = {"InstanceInfo",
                         "PortInstanceInfo",
                         "AnalyzerPortInstanceInfo",
                         "SegmentPortInstanceInfo",
                         "ParamInstanceInfo",
                         "SequenceInstanceInfo",
                         "SequenceBlockInstanceInfo",
                         "SegmentPortSequenceBlockInstanceInfo"};
  for (std::size_t i = 0; i < std::size(names); ++i) {
    EXPECT_STREQ(records[i]->IsA(), names[i]);
    EXPECT_STREQ(records[i]->Clone()->IsA(), names[i]) << "a clone keeps its class";
    EXPECT_TRUE(records[i]->isEqual(records[i]->Clone().get()));
    EXPECT_FALSE(records[i]->isEqual(nullptr));
  }
}

TEST(InstanceInfo, PortsAreEqualWhateverTheirInstanceNames) {
  PortInstanceInfo a("PDAT", 3), b("PDAT", 3);
  a.SetInstanceName("first");
  b.SetInstanceName("second");
  EXPECT_TRUE(a.isEqual(&b));
  EXPECT_FALSE(a.isEqual(std::make_unique<PortInstanceInfo>("PDAT", 4).get()));
  EXPECT_FALSE(a.isEqual(std::make_unique<PortInstanceInfo>("PCLK", 3).get()));
}

TEST(InstanceInfo, APortAndAnAnalyzerPortOfTheSamePortDiffer) {
  PortInstanceInfo port("PDAT", 3);
  AnalyzerPortInstanceInfo analyzer("PDAT", 3, 1);
  EXPECT_FALSE(port.isEqual(&analyzer));
  EXPECT_FALSE(analyzer.isEqual(&port));
  EXPECT_TRUE(analyzer.isEqual(std::make_unique<AnalyzerPortInstanceInfo>("PDAT", 3, 2).get()))
      << "the display does not count";
}

TEST(InstanceInfo, EveryTwoSequenceRecordsAreEqual) {
  SequenceInstanceInfo a, b;
  a.SetInstanceName("x");
  EXPECT_TRUE(a.isEqual(&b));
  EXPECT_FALSE(a.isEqual(std::make_unique<InstanceInfo>().get()));
}

TEST(InstanceInfo, TheFieldsThatCount) {
  InstanceInfo n1, n2;
  n1.SetInstanceName("a");
  EXPECT_FALSE(n1.isEqual(&n2));
  n2.SetInstanceName("a");
  EXPECT_TRUE(n1.isEqual(&n2));

  SegmentPortInstanceInfo s1("PDAT", 1, "ramp"), s2("PDAT", 1, "step");
  EXPECT_FALSE(s1.isEqual(&s2));
  s2.SetSegmentName("ramp");
  EXPECT_TRUE(s1.isEqual(&s2));

  ParamInstanceInfo p1(":CGR1:PER", 2, 0), p2(":CGR1:PER", 2, 1);
  EXPECT_FALSE(p1.isEqual(&p2));
  p2.SetStartPage(0);
  EXPECT_TRUE(p1.isEqual(&p2));
  EXPECT_FALSE(p1.isEqual(std::make_unique<ParamInstanceInfo>(":CGR1:PER", 3, 0).get()));

  EXPECT_FALSE(SequenceBlockInstanceInfo(2).isEqual(std::make_unique<SequenceBlockInstanceInfo>(3).get()));
  EXPECT_TRUE(SequenceBlockInstanceInfo(2).isEqual(std::make_unique<SequenceBlockInstanceInfo>(2).get()));

  SegmentPortSequenceBlockInstanceInfo b1("PDAT", 1, "ramp", 4);
  EXPECT_FALSE(
      b1.isEqual(std::make_unique<SegmentPortSequenceBlockInstanceInfo>("PDAT", 1, "ramp", 5).get()));
  EXPECT_FALSE(
      b1.isEqual(std::make_unique<SegmentPortSequenceBlockInstanceInfo>("PDAT", 1, "step", 4).get()));
  EXPECT_TRUE(b1.isEqual(std::make_unique<SegmentPortSequenceBlockInstanceInfo>("PDAT", 1, "ramp", 4).get()));
  EXPECT_FALSE(b1.isEqual(&s1));
}

TEST(InstanceInfo, WindowAndBoxAreKeptNotOwned) {
  NDRect16 box{1, 2, 300, 200};
  PortInstanceInfo a("PDAT", 1);
  a.SetResBox(&box);
  a.SetWin(reinterpret_cast<MDIChild*>(&box));
  PortInstanceInfo b = a;
  EXPECT_EQ(b.GetResBox(), &box);
  EXPECT_EQ(b.GetWin(), a.GetWin());
  EXPECT_EQ(InstanceInfo().GetResBox(), nullptr);
}

TEST(InstanceInfo, ListFormsAppendEachClassFieldsInOrder) {
  PortInstanceInfo port("PDAT", 3);
  port.SetInstanceName("Port 3");
  EXPECT_EQ(ListOf(port).AsExpression(), "(\"PortInstanceInfo\",\"Port 3\",\"PDAT\",3u)");
  EXPECT_EQ(ListOf(AnalyzerPortInstanceInfo("PDAT", 3, 2)).AsExpression(),
            "(\"AnalyzerPortInstanceInfo\",\"\",\"PDAT\",3u,2u)");
  EXPECT_EQ(ListOf(SegmentPortInstanceInfo("PDAT", 1, "ramp")).AsExpression(),
            "(\"SegmentPortInstanceInfo\",\"\",\"PDAT\",1u,\"ramp\")");
  EXPECT_EQ(ListOf(ParamInstanceInfo(":CGR1:PER", 2, 5)).AsExpression(),
            "(\"ParamInstanceInfo\",\"\",\":CGR1:PER\",2u,5u)");
  EXPECT_EQ(ListOf(SequenceInstanceInfo()).AsExpression(), "(\"SequenceInstanceInfo\",\"\")");
  EXPECT_EQ(ListOf(SequenceBlockInstanceInfo(7)).AsExpression(), "(\"SequenceBlockInstanceInfo\",\"\",7u)");
  EXPECT_EQ(ListOf(SegmentPortSequenceBlockInstanceInfo("PDAT", 1, "ramp", 7)).AsExpression(),
            "(\"SegmentPortSequenceBlockInstanceInfo\",\"\",\"PDAT\",1u,\"ramp\",7u)");
}

TEST(InstanceInfo, ConstructorsFromListsReadTheirElements) {
  const LispList list = Parsed("(\"AnalyzerPortInstanceInfo\",\"Analyser\",\"PDAT\",5,2)");
  AnalyzerPortInstanceInfo analyzer(list);
  EXPECT_EQ(analyzer.GetInstanceName(), "Analyser");
  EXPECT_EQ(analyzer.GetPortClass(), "PDAT");
  EXPECT_EQ(analyzer.GetPortNum(), 5u);
  EXPECT_EQ(analyzer.GetDisplay(), 2u);

  ParamInstanceInfo param(Parsed("(\"ParamInstanceInfo\",\"\",\":TRIG:MODE\",4,9)"));
  EXPECT_EQ(param.GetCmdPath(), ":TRIG:MODE");
  EXPECT_EQ(param.GetResType(), 4u);
  EXPECT_EQ(param.GetStartPage(), 0u) << "the start page is not read";

  SequenceBlockInstanceInfo block(Parsed("(\"SequenceBlockInstanceInfo\",\"\",12)"));
  EXPECT_EQ(block.GetBlockNum(), 12u);

  // Element 2 gives both the port class and the block number, exactly as the legacy reads it.
  SegmentPortSequenceBlockInstanceInfo stored(
      ListOf(SegmentPortSequenceBlockInstanceInfo("PDAT", 1, "ramp", 7)));
  EXPECT_EQ(stored.GetPortClass(), "PDAT");
  EXPECT_EQ(stored.GetSegmentName(), "ramp");
  EXPECT_EQ(stored.GetBlockNum(), 0u);

  // Short or mistyped lists leave the defaults.
  PortInstanceInfo sparse(Parsed("(\"PortInstanceInfo\",7)"));
  EXPECT_EQ(sparse.GetInstanceName(), "");
  EXPECT_EQ(sparse.GetPortNum(), 0u);
}

TEST(InstanceInfo, TheFactoryRebuildsOnlyFourClasses) {
  for (const InstanceInfo* record : std::initializer_list<const InstanceInfo*>{
           new InstanceInfo, new PortInstanceInfo("PDAT", 2), new AnalyzerPortInstanceInfo("PDAT", 2, 1),
           new ParamInstanceInfo(":CGR1:PER", 1, 0)}) {
    const LispList list = ListOf(*record);
    std::unique_ptr<InstanceInfo> made = NDTools::InstanceInfoFactory(&list);
    ASSERT_NE(made, nullptr) << record->IsA();
    EXPECT_STREQ(made->IsA(), record->IsA());
    EXPECT_TRUE(made->isEqual(record));
    delete record;
  }
  for (const InstanceInfo* record : std::initializer_list<const InstanceInfo*>{
           new SegmentPortInstanceInfo("PDAT", 1, "s"), new SequenceInstanceInfo,
           new SequenceBlockInstanceInfo(1), new SegmentPortSequenceBlockInstanceInfo("PDAT", 1, "s", 1)}) {
    const LispList list = ListOf(*record);
    EXPECT_EQ(NDTools::InstanceInfoFactory(&list), nullptr) << record->IsA();
    delete record;
  }
  const LispList word = Parsed("(PortInstanceInfo,\"n\",PDAT,1)");
  EXPECT_NE(NDTools::InstanceInfoFactory(&word), nullptr) << "a bare word is text as well";
  const LispList empty;
  EXPECT_EQ(NDTools::InstanceInfoFactory(&empty), nullptr);
  EXPECT_EQ(NDTools::InstanceInfoFactory(nullptr), nullptr);
  const LispList nested = Parsed("((\"InstanceInfo\"),\"\")");
  EXPECT_EQ(NDTools::InstanceInfoFactory(&nested), nullptr);
}

}  // namespace
