#pragma once

#include <vector>

#include "support/ConditionList.h"
#include "support/Dstring.h"

// Everything the core asks of a GUI toolkit. The Qt adapter serves the GUI; the headless
// adapter serves tests and headless hosts. Callbacks are plain procedures with a client.
class ToolkitPort {
 public:
  using Proc = void (*)(void* client);
  enum class Icon { Information, Warning, Critical };
  static constexpr int kYes = 2;
  static constexpr int kNo = 1;
  static constexpr int kCancel = 0;

  virtual ~ToolkitPort() = default;

  // One-shot callback alarm: `proc(client)` runs once, `ms` milliseconds from now, from the
  // event loop. Arming again replaces the pending alarm.
  virtual void StartCBackAlarm(unsigned ms, Proc proc, void* client) = 0;
  virtual void StopCBackAlarm() = 0;
  // Waits for the next event and handles it.
  virtual void ProcessNext() = 0;
  // Handles what is pending without waiting.
  virtual void Update() = 0;
  // Runs `proc(client)` from the event loop, after the current event.
  virtual void CallDeferred(Proc proc, void* client) = 0;

  virtual void Alert(const Dstring& text, Icon icon) = 0;
  // kYes or kNo.
  virtual int AskYesNo(const Dstring& text) = 0;
  // kYes, kNo or kCancel: a question whose answer may also be to go back.
  virtual int AskYesNoCancel(const Dstring& text) = 0;
  // A question whose answers say what they do: kYes for `yes` ("Save"), kNo for `no`
  // ("Discard"), kCancel to go back. An empty `no` offers only `yes` and Cancel.
  virtual int AskChoice(const Dstring& text, const Dstring& yes, const Dstring& no) = 0;
  virtual void SetWaitCursor(bool on) = 0;
  virtual bool IsShiftDown() = 0;

  // Opens the resource library `name` (windows and dialogs) and checks that every resource
  // in it can be read; a missing or broken one is a condition naming it.
  virtual int LoadResourceLibrary(const Dstring& name, ConditionList& list) = 0;
  // Makes a class of the library known to the resource loader by its class name ("UnitEd").
  virtual int RegisterClass(const Dstring& className, ConditionList& list) = 0;
  // Binds a window resource ("paramedit.ParamEd") to its window class, and the reverse.
  virtual void RegisterWindow(const Dstring& resource) = 0;
  virtual void UnregisterWindow(const Dstring& resource) = 0;
  // Hands script constants, events or verbs (`kind`) to the toolkit's script registry.
  virtual void RegisterScriptItems(const char* kind, const std::vector<Dstring>& names, unsigned flag) = 0;
};
