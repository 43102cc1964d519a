#pragma once

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "common/InstrumentFixture.h"
#include "sequences/CPortInfo.h"
#include "sequences/CSequence.h"
#include "sequences/CSequenceObserver.h"
#include "sequences/FakeSequencer.h"

// Writes every report it gets as one line ("BlockInserted 2", "LoopInserted 1,2,2,2"), and can
// fail a report or edit the sequence from within one.
class RecordingObserver : public CSequenceObserver {
 public:
  std::vector<std::string> log;
  int failWith = 0;

  int NfyBlockInserted(unsigned long b, ConditionList&) override { return Note("BlockInserted", b); }
  int NfyBlockDeleted(unsigned long b, ConditionList&) override { return Note("BlockDeleted", b); }
  int NfyBlockLabelChanged(unsigned long b, ConditionList&) override { return Note("BlockLabelChanged", b); }
  int NfyBlockLengthChanged(unsigned long b, ConditionList&) override {
    return Note("BlockLengthChanged", b);
  }
  int NfyBlockMeasureChanged(unsigned long b, ConditionList&) override {
    return Note("BlockMeasureChanged", b);
  }
  int NfyBlockSyncChanged(unsigned long b, ConditionList&) override { return Note("BlockSyncChanged", b); }
  int NfyBlockTriggerChanged(unsigned long b, ConditionList&) override {
    return Note("BlockTriggerChanged", b);
  }
  int NfyBlockVXITriggerChanged(unsigned long b, ConditionList&) override {
    return Note("BlockVXITriggerChanged", b);
  }
  int NfyBlockReactionsChanged(unsigned long b, ConditionList&) override {
    return Note("BlockReactionsChanged", b);
  }
  int NfySegmentChanged(unsigned long b, unsigned long p, ConditionList&) override {
    return Note("SegmentChanged " + std::to_string(b) + "," + std::to_string(p));
  }
  int NfyLoopInserted(long l, long s, long n, long i, ConditionList&) override {
    return Loop("LoopInserted", l, s, n, i);
  }
  int NfyLoopDeleted(long l, long s, long n, long i, ConditionList&) override {
    return Loop("LoopDeleted", l, s, n, i);
  }
  int NfyLoopIterationsChanged(long l, long s, long n, long i, ConditionList&) override {
    return Loop("LoopIterationsChanged", l, s, n, i);
  }
  int NfyLoopTriggerChanged(long l, long s, long n, long i, ConditionList&) override {
    return Loop("LoopTriggerChanged", l, s, n, i);
  }
  int NfyLoopVXITriggerChanged(long l, long s, long n, long i, ConditionList&) override {
    return Loop("LoopVXITriggerChanged", l, s, n, i);
  }
  int NfyUpdateLoops(ConditionList&) override { return Note("UpdateLoops"); }
  int NfySequence(ConditionList&) override { return Note("Sequence"); }

 private:
  int Note(const std::string& line) {
    log.push_back(line);
    return failWith;
  }
  int Note(const char* what, unsigned long block) {
    return Note(std::string(what) + " " + std::to_string(block));
  }
  int Loop(const char* what, long l, long s, long n, long i) {
    return Note(std::string(what) + " " + std::to_string(l) + "," + std::to_string(s) + "," +
                std::to_string(n) + "," + std::to_string(i));
  }
};

// A block element of the second generation: trigger 0, the given length, measure 0, no VXI
// trigger, no reactions, and the two data ports of FakeSequencer playing `first` and `second`.
inline std::string Blk(unsigned long length, const std::string& first = "PAUSE",
                       const std::string& second = "PAUSE0") {
  return "(BLOCK,0," + std::to_string(length) + ",0,\"\",()," + first + ",0,0," + second + ",0,0)";
}
// A whole version 3.0 expression.
inline std::string Seq(const std::string& body, const std::string& label = "") {
  return "(3.0,\"" + label + "\"," + body + ")";
}

// QenGuiInst on the fake sequencer, three loop levels, the fake's configuration known, and a
// sequence model with a recording observer.
class SequenceFixture : public InstrumentFixture {
 protected:
  void SetUp() override {
    InstrumentFixture::SetUp();
    CSequence::EndNumLoopLevels();
    CSequence::SetNumLoopLevels(3);
    CSequence::ClearClipboard();
    CPortInfo::Invalidate();
    ASSERT_EQ(CPortInfo::SetConfiguration(FakeSequencer::kConfiguration, mList), 0);
    mFake.Install(Inst());
    mSeq.SetPortSource(&CPortInfo::GetSequencePorts);
    mSeq.AddObserver(&mObserver);
  }
  void TearDown() override {
    mSeq.RemoveObserver(&mObserver);
    CPortInfo::Invalidate();
    CSequence::EndNumLoopLevels();
    CSequence::ClearClipboard();
    InstrumentFixture::TearDown();
  }

  // Puts `text` on the server and reads it; the reports of that read are forgotten.
  void Load(const std::string& text) {
    mFake.sequence = text;
    ASSERT_EQ(mSeq.ReadSequence(mList, 1), 0) << mList.ToText();
    ASSERT_EQ(mSeq.GetLastExpression(), text);
    mObserver.log.clear();
    mFake.received.clear();
  }
  // The model written as an expression.
  std::string Written() {
    Dstring out;
    ConditionList list;
    EXPECT_EQ(mSeq.asExpression(out, list), 0) << list.ToText();
    return out;
  }
  std::string LastKey() const { return mList.IsEmpty() ? "" : mList.Last().GetKey(); }

  FakeSequencer mFake;
  CSequence mSeq;
  RecordingObserver mObserver;
};
