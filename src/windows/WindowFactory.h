#pragma once

#include "core/WindowResource.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

class QWidget;

// Builds the windows of the window table (uiapp::WindowResources) by their resource names.
class WindowFactory {
 public:
  // The table's entry of a resource; null for a name not in it.
  static const WindowResource* Find(const Dstring& resource);
  // A new, loaded window of the resource under `parent`; null with a condition when the name is
  // not in the table or the window cannot be built.
  static QWidget* Make(const Dstring& resource, QWidget* parent, ConditionList& list);
};
