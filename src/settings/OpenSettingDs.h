#pragma once

#include <functional>
#include <optional>

#include "data/QenDs.h"
#include "support/Dstring.h"

class SettingMRU;

// The setting the instrument holds: the name it was last loaded or saved under (empty for a
// new setting) and whether it changed since. The record lives in the system profile, so that
// every client, and the next start, sees the same: "OPENSETTING_NAME",
// "OPENSETTING_CABLEDELAY", "OPENSETTING_MODIFIED" (0u/1u) and "OPENSETTING_STAMP", a new text
// at every load, new setting and save by any client.
//
// Changes are seen through a watch handle: a second handle of this client that never writes,
// so its change set (":DFL?") holds every change, this client's own as well as any other's. A
// change of anything a setting holds marks it modified, in the record too; changes of the run
// and system states, the outputs, the system profile, segments and unit attributes do not.
// "ALL" is a new or loaded setting when the stamp moved, and otherwise a change of everything.
// Views are told when the name or the modified state changes.
class OpenSettingDs : public QenDs {
 public:
  using StampSource = std::function<Dstring()>;
  // Asked before a save replaces the setting of that name; true to replace it.
  using ReplaceQuestion = std::function<bool(const Dstring& name)>;

  OpenSettingDs();

  // Reads the record; what it does not hold is an unnamed, unmodified setting.
  int Read(ConditionList& list);
  // Creates the watch handle, proposed as the application handle followed by "W".
  int Follow(const Dstring& resource, ConditionList& list);
  int EndFollow(ConditionList& list);
  bool IsFollowing() const { return !mWatch.empty(); }
  // One poll of the watch handle. First writes the record when an operation could not, or
  // reads it when the last read failed.
  int UpdateFromFW(ConditionList& list);

  // The File menu's operations. Each records what the instrument then holds and puts a loaded
  // or saved name first in `mru`. One that fails leaves the instrument, the saved settings and
  // this record as they were, and says so in `list`: the operation first, then the reason
  // ("GUI_SETTING_LOCKED" when another client holds the instrument).
  int New(ConditionList& list);
  int Load(const Dstring& name, bool cableDelay, SettingMRU& mru, ConditionList& list);
  // With `replace`, a name the instrument keeps already is asked about first (the catalogue
  // is read for it); a no returns SettingsStatus::kDeclined with nothing done or said.
  int Save(const Dstring& name, SettingMRU& mru, ConditionList& list, const ReplaceQuestion& replace = nullptr);

  const Dstring& GetName() const { return mName; }
  bool IsModified() const { return mModified; }
  // The name, or "UNTITLED" for a new setting, and " *" while it is modified.
  Dstring Title() const;

  // Tests fix the stamps.
  void SetStampSource(StampSource source) { mStampSource = std::move(source); }

 private:
  struct Record {
    Dstring name;
    // Written with a load only; never read back.
    std::optional<bool> cableDelay;
    bool modified = false;
    Dstring stamp;
  };

  int ReadRecord(Record& record, ConditionList& list);
  int WriteRecord(const Record& record, ConditionList& list);
  // Takes the record as what the instrument holds; tells the views when that changed.
  void Adopt(const Record& record);
  // After this client's own load, new setting or save: the record, the change set emptied of
  // what the operation itself changed, and the recently used list.
  int Opened(Record record, SettingMRU* mru, ConditionList& list);
  int MarkModified(ConditionList& list);
  void DropChanges();

  Dstring mName;
  bool mModified = false;
  Dstring mStamp;
  // Whether the record on the server says modified, as far as this client knows.
  bool mRecordModified = false;
  bool mRecordRead = false;
  // What this client's own operation made of the setting while the record could not be written.
  std::optional<Record> mUnwritten;
  Dstring mWatch;
  StampSource mStampSource;
};
