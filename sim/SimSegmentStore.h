#pragma once

#include <filesystem>
#include <map>
#include <memory>

#include "SimCommandModule.h"
#include "SimSegment.h"
#include "SimSegmentClip.h"
#include "support/DataParcel.h"

// The segment store: segments kept as files under "<data directory>/segments" (a name
// "A/B" is the file "A/B.qseg"), opened by number, edited in memory and saved on request.
// Opening a name that is open already gives the same number, so every client edits the same
// segment; it stays in memory until the last open is closed. The clipboard is one for the
// whole server. docs/simulator.md lists the commands.
class SimSegmentStore : public SimCommandModule {
 public:
  // Without a data directory segments live in memory only and cannot be saved.
  explicit SimSegmentStore(const Dstring& dataDir);

  bool RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) override;
  // The segment of that name as a client would open it (the open one, else its file); null
  // when there is none.
  std::shared_ptr<const SimSegment> Find(const Dstring& name) const;

 private:
  struct OpenSegment {
    std::shared_ptr<SimSegment> segment;
    int count = 0;
  };
  using StoreHandler = int (SimSegmentStore::*)(const SimCommand&, SimContext&);
  using SegmentHandler = int (SimSegmentStore::*)(unsigned, SimSegment&, const SimCommand&, SimContext&);
  struct StoreEntry {
    const char* path;
    StoreHandler query;
    StoreHandler write;
  };
  struct SegmentEntry {
    const char* path;
    SegmentHandler query;
    SegmentHandler write;
    bool changes;  // a successful write changes the segment: the other clients hear of it
  };
  static const StoreEntry kStoreCommands[];
  static const SegmentEntry kSegmentCommands[];

  bool RunSegmentCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context);
  // The file of a segment name; false for a name that cannot be one.
  bool PathOf(const Dstring& name, std::filesystem::path& path) const;
  // The handlers return 0 or the SCPI error, which the dispatcher queues.
  // Reads the arguments into min..max items: -109 or -104 otherwise.
  static int Args(const SimCommand& cmd, DataParcel& items, std::size_t min, std::size_t max);
  // The one argument, a quoted name.
  static int Name(const SimCommand& cmd, Dstring& name);
  // Items `from` .. `from + count - 1` as integers.
  static int Longs(const DataParcel& items, std::size_t from, std::size_t count, long* out);
  unsigned NumberOf(const Dstring& name) const;
  unsigned Remember(std::shared_ptr<SimSegment> segment);

  int Open(const SimCommand& cmd, SimContext& context);
  int RealPath(const SimCommand& cmd, SimContext& context);
  int Create(const SimCommand& cmd, SimContext& context);
  int Exists(const SimCommand& cmd, SimContext& context);
  int Catalog(const SimCommand& cmd, SimContext& context);
  int Delete(const SimCommand& cmd, SimContext& context);
  int FileInfo(const SimCommand& cmd, SimContext& context);
  int ClipFilled(const SimCommand& cmd, SimContext& context);
  // (test control) The time each step of long work takes.
  int Pace(const SimCommand& cmd, SimContext& context);
  int ClipWidth(const SimCommand& cmd, SimContext& context);
  int ClipLength(const SimCommand& cmd, SimContext& context);
  int ClipCoding(const SimCommand& cmd, SimContext& context);

  int Close(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int Save(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int QueryType(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int WriteType(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int QueryParam(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int WriteParam(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int QueryLength(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int QueryWidth(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int QueryCoding(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int WriteCoding(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int QueryData(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int WriteData(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int Fill(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int Invert(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int Mirror(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int Copy(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int Paste(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int Insert(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int Remove(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int Serialize(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int Deserialize(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int Convert(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int FindFirst(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int FindNext(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int FindPrevious(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int ErrorFirst(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int ErrorNext(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int ErrorPrevious(unsigned number, SimSegment& segment, const SimCommand& cmd, SimContext& context);
  int Find(const SimSegment& segment, const SimCommand& cmd, const Dstring& direction, SimContext& context);
  int FindErrorFrom(const SimSegment& segment, const SimCommand& cmd, const Dstring& direction,
                    SimContext& context);

  std::filesystem::path mDir;  // empty: no files
  std::map<unsigned, OpenSegment> mOpen;
  unsigned mNextNumber = 1;
  SimSegmentClip mClip;
  int mPaceMs = 0;
};
