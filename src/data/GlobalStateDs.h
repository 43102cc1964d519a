#pragma once

#include "data/QenDs.h"
#include "data/QenDsView.h"
#include "support/Dstring.h"

// A process-wide state source that follows one instrument setting. It is a view of the
// dirty-flag source: when the server reports its setting changed, it reads the value anew and
// tells its own views only if the value changed. Values are read by UpdateFromFW and kept;
// the accessors of the derived sources ask nothing.
class GlobalStateDs : public QenDs, public QenDsView {
 public:
  virtual int UpdateFromFW(ConditionList& list) = 0;

  int NfyViewDataUpdated(QenDs*, ConditionList& list) override { return UpdateFromFW(list); }
  // The setting's header with or without the handle, without regard to case or leading colon.
  int Match(const Dstring& name) override;

 protected:
  // `setting` is the header after the handle, as ":SGEN:GLOB:INIT:CONT".
  explicit GlobalStateDs(Dstring setting) : mSetting(std::move(setting)) {}

  // Sends "<handle><setting>?"; the reply is trimmed.
  int Query(Dstring& reply, ConditionList& list);
  // Sends "<handle><setting> <word>".
  int Send(const char* word, ConditionList& list);
  // Keeps the new value and tells the views when it differs from the old one.
  template <typename T>
  int Change(T& current, T value, ConditionList& list) {
    if (current == value) return 0;
    current = value;
    return Update(list, 0);
  }
  void SetSetting(Dstring setting) { mSetting = std::move(setting); }

 private:
  Dstring mSetting;
};
