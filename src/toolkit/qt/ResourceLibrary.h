#pragma once

#include "support/ConditionList.h"
#include "support/Dstring.h"

class QWidget;

// The compiled-in resource library "uiapp": one Designer form per window or dialog resource,
// named after it ("unitsdlg.UnitsDialog"). The windows build their forms through uic (a Ui::
// class each) and call InitWidgets after setupUi; the library itself still checks every form
// and builds by name what is only known at run time. Forms built here may hold the library's
// own classes, made through the run-time class table. After a form is built, every bound
// control in it is initialised, so it registers with the engine under the names its
// attributes give.
class ResourceLibrary {
 public:
  // Checks that the library `name` exists and that every form in it parses.
  static int Check(const Dstring& name, ConditionList& list);
  // Builds the resource into a new widget under `parent`; null with "GUI_RESOURCE_MISSING" or
  // "GUI_RESOURCE_BROKEN" naming it.
  static QWidget* Load(const Dstring& resource, QWidget* parent, ConditionList& list);
  // Builds the resource into `target` itself: its layout and children move onto it, and its
  // title and size are taken. For dialogs and windows that are classes of their own.
  static int LoadInto(const Dstring& resource, QWidget* target, ConditionList& list);
  // Initialises every widget of the library under `root` (and `root` itself) now that the
  // form has set its attributes: what a form built by uic needs after setupUi.
  static void InitWidgets(QWidget* root);
};
