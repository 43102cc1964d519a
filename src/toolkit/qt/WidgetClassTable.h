#pragma once

#include <functional>

#include "support/ConditionList.h"
#include "support/Dstring.h"

class QWidget;

// The run-time class table of the resource loader: the widget classes of the library that a
// resource may name. A class is offered by its layer (AddFactory) and becomes usable in
// resources once the application registers it by name (Register).
class WidgetClassTable {
 public:
  using Factory = std::function<QWidget*(QWidget* parent)>;

  static void AddFactory(const Dstring& className, Factory factory);
  // "GUI_CLASS_UNKNOWN" when no layer offers the class.
  static int Register(const Dstring& className, ConditionList& list);
  static void UnregisterAll();
  static bool IsRegistered(const Dstring& className);
  // A new widget of a registered class, or null.
  static QWidget* Create(const Dstring& className, QWidget* parent);
};
