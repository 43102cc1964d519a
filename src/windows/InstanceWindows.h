#pragma once

#include <QString>

#include "support/ConditionList.h"
#include "support/Dstring.h"

class InstanceInfo;
class MainWin;
class QWidget;

// Windows opened for an instance record: which port, segment, sequence or block a window shows.
// A request for a record equal (isEqual) to that of an open window raises that window instead of
// opening another; each window keeps a copy of its record for as long as it is open.
class InstanceWindows {
 public:
  // The window of `resource` for the record, raised or built and shown in the main window's
  // area under `title`; null when it cannot be built (the condition is in the list).
  static QWidget* Open(MainWin& main, const Dstring& resource, const InstanceInfo& info, const QString& title,
                       ConditionList& list);
  // The open window of a record equal to `info`; null when there is none.
  static QWidget* Find(const MainWin& main, const InstanceInfo& info);
  // The record a window was opened for; null for a window opened without one.
  static const InstanceInfo* GetInstanceInfo(const QWidget* window);
};
