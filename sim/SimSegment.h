#pragma once

#include <map>
#include <string>
#include <string_view>

#include "SimSegmentClip.h"
#include "SimSegmentGenerator.h"
#include "SimSegmentRows.h"
#include "support/Dstring.h"

// One segment as the server keeps it: memory data (type MEM) packed in rows, or a generated
// stream (PRBS, PRWS, SFI5) worked out on demand. Operations return 0 or the SCPI error code,
// and change nothing when they fail. Positions are (trace, vector), ranges inclusive.
class SimSegment {
 public:
  // Memory data may hold at most this many bits: a 16M x 64 two-state segment and then some.
  static constexpr long long kMaxBits = 1LL << 31;
  static constexpr long kMaxWidth = 4096;
  // The most bytes one data block carries, read or written.
  static constexpr long kMaxBlockBytes = 16L * 1024 * 1024;

  // The codings the instrument knows, with the states in state-number order.
  static bool IsKnownCoding(const Dstring& coding);
  static int StateWidthOf(const Dstring& coding);

  // An empty segment of memory data in the coding "01".
  explicit SimSegment(Dstring name) : mName(std::move(name)) {}

  const Dstring& GetName() const { return mName; }
  const Dstring& GetType() const { return mType; }
  const Dstring& GetCoding() const { return mCoding; }
  long GetWidth() const;
  long GetLength() const;
  bool IsGenerated() const { return mType != "MEM"; }
  // The state character at (trace, vector), which must lie inside.
  char StateAt(long trace, long vector) const;

  int SetType(const Dstring& type);
  int SetCoding(const Dstring& coding);
  int Convert(const Dstring& from, const Dstring& to);

  // The block of the range appended to `out`; a reply has the block's header before it, so
  // that the whole reply is made in one piece.
  int ReadBlock(long t0, long v0, long t1, long v1, std::string& out, bool header = false) const;
  int WriteBlock(long t0, long v0, long t1, long v1, std::string_view block);
  // The states of a memory data range, whatever its size, to be put back after work that
  // was cancelled; PutBack takes only what Keep gave for the same range.
  int Keep(long t0, long v0, long t1, long v1, std::string& states) const;
  void PutBack(long t0, long v0, long t1, long v1, const std::string& states);
  int Fill(long t0, long v0, long t1, long v1, long state);
  int Invert(long t0, long v0, long t1, long v1);
  int Mirror(long t0, long v0, long t1, long v1, bool traces);
  int Copy(long t0, long v0, long t1, long v1, SimSegmentClip& clip) const;
  int Paste(const SimSegmentClip& clip, long trace, long vector);
  int Insert(long position, bool vectors, bool after, long count);
  int Delete(long position, bool vectors, long count, bool clear);
  int Serialize(bool msbFirst);
  int Deserialize(long width, long offset);

  // Generator parameters, kept in the expression form the client reads back ("(NORMAL)").
  int SetParam(const Dstring& name, const Dstring& value);
  int GetParam(const Dstring& name, Dstring& value) const;
  const std::map<Dstring, Dstring>& GetParams() const { return mParams; }

  // For the files: the whole state at once, checked.
  int Restore(const Dstring& type, const Dstring& coding, long width, std::map<Dstring, Dstring> params,
              SimSegmentRows rows);
  const SimSegmentRows& GetRows() const { return mRows; }

 private:
  static std::map<Dstring, Dstring> DefaultParams();
  static void ClearForeignHeaders(std::map<Dstring, Dstring>& params);

  int CheckRange(long t0, long v0, long t1, long v1) const;
  int CheckMemory() const;
  // The generator set up from the parameters; false when they make no stream.
  bool Configure(const std::map<Dstring, Dstring>& params, SimSegmentGenerator& generator) const;
  // The states of a range as memory rows (generated data worked out).
  int CopyRows(long t0, long v0, long t1, long v1, SimSegmentRows& rows) const;
  // The data as memory rows, for a change of type.
  int Materialise(SimSegmentRows& rows) const;

  Dstring mName;
  Dstring mType = "MEM";
  Dstring mCoding = "01";
  long mGeneratedWidth = 1;
  SimSegmentRows mRows;
  std::map<Dstring, Dstring> mParams = DefaultParams();
  SimSegmentGenerator mGenerator;
};
