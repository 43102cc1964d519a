#pragma once

#include "settings/TypedProfile.h"
#include "support/ConditionList.h"
#include "support/DataParcel.h"
#include "support/Dstring.h"
#include "support/LispList.h"

class DirtyFlagDs;
class QenDs;

// Named values that belong to the setting on the instrument: kept on the server as one list
// expression, "(2.0,("NAME","(12i)"),...)", the format version first and then one entry per
// name pairing it with its value text (ProfileValue). Read fetches the whole list, Get/SetValue
// work on the copy held here, Write sends it back. A new name is appended at the end.
//
// Init registers a procedure on the dirty-flag source that reads the list again whenever the
// server reports that the setting's profile changed, or that everything did (a setting was
// loaded). What the server holds wins over values set here and not yet written.
//
// Every failure adds its condition and returns nonzero; the held list stays as it was, except
// that a list of another version is replaced by an empty one of version 2.0.
class QENSettingProfile : public TypedProfile<QENSettingProfile> {
 public:
  static constexpr double kVersion = 2.0;
  // The changed-setting name that the procedure follows (after the handle).
  static constexpr const char* kChangedName = ":CONF:CSET:PROF:EXPR";

  // `dirtyFlag` may be null: nothing is followed.
  static void Init(DirtyFlagDs* dirtyFlag);
  static void End();

  static int Read(ConditionList& list);
  static int Write(ConditionList& list);
  // Whether values were set here since the last Read or Write.
  static unsigned IsDirty() { return mIsDirty; }
  static const LispList& GetNameValues() { return mNameValues; }

  static int Exists(const Dstring& name, int& exists, ConditionList& list);

  // The procedures on the dirty-flag source.
  static int MatchDirtyFlag(QenDs* source, void* client, const Dstring& name);
  static int NfyDirtyFlag(QenDs* source, void* client, ConditionList& list);

 private:
  friend class TypedProfile<QENSettingProfile>;
  static constexpr bool kParens = true;
  // A text value is the text itself.
  static Dstring TextValue(const Dstring& text) { return text; }
  // The value text of the entry of `name`.
  static int FindText(const Dstring& name, Dstring& text, ConditionList& list);
  template <typename T>
  static int GetTyped(const Dstring& name, T& value, ConditionList& list);
  static int Put(const Dstring& name, const Dstring& text, ConditionList& list);
  static int CheckVersion(const LispList& parsed, ConditionList& list);

  static LispList mNameValues;
  static unsigned mIsDirty;
  static DirtyFlagDs* mDirtyFlag;
};

extern template class TypedProfile<QENSettingProfile>;
