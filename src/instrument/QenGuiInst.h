#pragma once

#include <functional>
#include <memory>

#include "instrument/QenInstrument.h"
#include "support/ConditionList.h"
#include "support/DstringList.h"

class Condition;

// The one call path to the instrument server. Keeps the connection and the application
// handle, sends every command, and on failure drains the handle's error queue into the
// caller's ConditionList. Static: lives from Init to End.
class QenGuiInst {
 public:
  static void Init();
  static void End();

  // Takes the connection; the previous one is disconnected and deleted.
  static void SetInstrument(std::unique_ptr<QenInstrument> instrument);
  static QenInstrument* GetInstrument() { return mInstrument.get(); }
  static int IsConnectedToServer();
  static int DisconnectFromServer(ConditionList& list);

  static Dstring GetAppHandle() { return mAppHandle; }
  static void SetAppHandle(const Dstring& handle) { mAppHandle = handle; }
  static Dstring GetHandleFromCommand(const Dstring& cmd);

  static int Call(const Dstring& cmd, Dstring& reply, ConditionList& list);
  static int Call(QenInstrument* instrument, const Dstring& cmd, Dstring& reply, ConditionList& list);
  static int ClearErrorQueue(QenInstrument* instrument, const Dstring& handle);
  static void GetErrors(QenInstrument* instrument, const Dstring& handle, int& status, ConditionList& list);

  // Reads an error-queue entry: a signed decimal code, a comma, then the message in double
  // quotes. Returns 0 when it parsed.
  static int ParseErrorMsg(const Dstring& text, long& code, long& position, Dstring& message);
  static int ParseErrorMsg(const Dstring& text, Condition& condition);
  // The user-facing form of a message: trimmed, never empty, ending in a full stop.
  static void FormatErrorStr(Dstring& message, int code);
  // Shows the conditions in one critical alert: "ERROR <code>\n\n<message>" each, joined by a
  // line of dashes. Nothing is shown for an empty list. The first condition of each refused
  // command is preceded by what the describer says of it, when one is installed.
  static int ShowErrorDlg(ConditionList& list, int);
  static Dstring ErrorDlgText(const ConditionList& list);
  // Says in the user's words what a condition's command asked for ("Group 1 › Module 1 ›
  // Port 1 · Amplitude: 7 V asked; …"), or nothing. The windows install it. Null removes it.
  using RefusalDescriber = std::function<Dstring(const Condition& condition)>;
  static void SetRefusalDescriber(RefusalDescriber describer);

  // What happens when the server has died (-18): the message is shown and the process ends
  // with exit code 0. The GUI installs its own alert; tests install one that records.
  using ServerDeathHandler = std::function<void(const Dstring& message)>;
  // Returns the handler it replaces.
  static ServerDeathHandler SetServerDeathHandler(ServerDeathHandler handler);
  // What the default handler runs between its message and the exit: the core writes the
  // user's unsaved work out here. Null removes it. A handler of its own may run it too.
  using BeforeExitProc = std::function<void()>;
  static void SetBeforeServerDeathExit(BeforeExitProc proc);
  static void RunBeforeServerDeathExit();
  // Told of every condition that a failed command brought, with the command: the session's
  // error list. Null removes it.
  using ErrorListenerProc = std::function<void(const Dstring& cmd, const Condition& condition)>;
  static void SetErrorListener(ErrorListenerProc listener);
  // The hosts of `candidates` (loopback first when given) on which a server answers a
  // connection at `port` within `timeoutMs` each, in the order given.
  static void ListServerHostsAtPort(DstringList& found, unsigned short port, unsigned long timeoutMs,
                                    const DstringList& candidates);
  // The hosts worth asking: loopback, then QEN_SERVER_HOSTS (comma-separated), then `remembered`.
  static DstringList CandidateHosts(const DstringList& remembered);

  // Whether the last exchange found the instrument held by another client. While it is, the
  // operation guards ask the server again (a harmless query) until the lock is gone.
  static bool IsInstrumentLocked();

  // The waiter of every call on the application's connection (not owned; null for none):
  // while a call waits, the host's events run and every guarded operation they would start
  // is held off (FWBlocker::WaitScope).
  static void SetCallWaiter(CallWaiter* waiter);
  // Whether a call is waiting for its reply while events run.
  static bool IsWaiting() { return mWaitDepth > 0; }
  // Runs `proc(client)` from the event loop once no call waits any more: at once (deferred)
  // when none waits, else after the wait. Asked twice during one wait, it runs once.
  using Proc = void (*)(void* client);
  static void RunAfterWait(Proc proc, void* client);

  static constexpr const char* kServerDeathMessage =
      "The user interface will be terminated\nbecause the firmware server has died.";

  // Appends to the log file and flushes; nothing while there is no log.
  static void Log(const Dstring& text);

 private:
  static std::unique_ptr<QenInstrument> mInstrument;
  static Dstring mAppHandle;
  static std::FILE* errorlog;
  static bool mLocked;
  static CallWaiter* mWaiter;
  static int mWaitDepth;
};
