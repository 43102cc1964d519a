#pragma once

#include <string>

#include "common/InstrumentFixture.h"
#include "segments/QenSegmentDs.h"
#include "segments/QenSegmentPool.h"
#include "segments/SegmentBuffer.h"

// The scripted instrument with the segment pool running, and shorthands for the exchanges
// of opening a segment (number 3) and loading a buffer of it.
class SegmentFixture : public InstrumentFixture {
 protected:
  void SetUp() override {
    InstrumentFixture::SetUp();
    QenSegmentPool::Init();
  }
  void TearDown() override {
    QenSegmentPool::End();
    InstrumentFixture::TearDown();
  }

  static Dstring Seg(const Dstring& tail) { return "_H:EDIT:SEGM3" + tail; }

  QenSegmentDs* OpenSegment(const Dstring& name = "S", bool saved = true) {
    QenSegmentDs* ds = QenSegmentPool::AllocDs(name);
    Inst().Expect("_H:EDIT:SEGM:OPEN? \"" + name + "\"", "3");
    Inst().Expect("_H:EDIT:SEGM:RPAT? \"" + name + "\"", "\"/d/" + name + ".qseg\"");
    Inst().Expect("_H:MMEM:INF? \"/d/" + name + ".qseg\"", "12,\"2024-01-01T00:00:00\"", saved ? 0 : 1);
    if (!saved) ExpectErrors("-256,\"File name not found\"");
    EXPECT_EQ(ds->Open(mList), 0) << mList.ToText();
    return ds;
  }

  // The error queue after a failed command: the entry, then empty.
  void ExpectErrors(const Dstring& entry) {
    Inst().Expect(":_H:SYST:ERR?", entry);
    Inst().Expect(":_H:SYST:ERR?", "0,\"No error\"");
  }

  void ExpectDimension(const Dstring& coding, long length, long width) {
    Inst().Expect(Seg(":PATT:COD?"), "\"" + coding + "\"");
    Inst().Expect(Seg(":PATT:LENG?"), std::to_string(length));
    Inst().Expect(Seg(":PATT:WIDT?"), std::to_string(width));
  }

  static Dstring Block(const std::string& bytes) { return Dstring::Format("#5%05zu", bytes.size()) + bytes; }

  // A buffer of `bufferLength` vectors from `start` over a segment of `length` x `width`,
  // loaded with `bytes`.
  SegmentBuffer* Load(QenSegmentDs* ds, const Dstring& coding, long length, long width, long start,
                      long bufferLength, const std::string& bytes) {
    SegmentBuffer* buffer = nullptr;
    ds->CreateBuffer(buffer, mList);
    EXPECT_EQ(ds->SetBufferStartAndLength(buffer, start, bufferLength, mList), 0);
    ExpectDimension(coding, length, width);
    if (width > 0 && bufferLength > 0) {
      Inst().Expect(
          Seg(Dstring::Format(":PATT:DATA? 0,%ld,%ld,%ld,BIN", start, width - 1, start + bufferLength - 1)),
          Block(bytes));
    }
    EXPECT_EQ(ds->Init(buffer, mList), 0) << mList.ToText();
    return buffer;
  }
};
