#pragma once

#include <string_view>

#include "data/QenDsView.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

class QenParamDs;

// The one binding of every data-bound control to its parameter source, in the manner of a
// settings dialog manager: the control holds a name in two attributes, and this object
// registers a view under that name, asks the control to refresh on every notification,
// queries and writes through the source, and keeps what the control shows beside the value
// (failed, clashing, the last error, a value the server took differently from the one asked).
//
// The source's name is DsBaseName + DsCmdName; an empty DsBaseName leaves the control unbound.
// In design mode (inside the form designer) nothing binds, queries or writes. With an
// attribute view (the parameter fields), a second view watches the name followed by ":ATTR".
class DsBinding : public QenDsView {
 public:
  class Client {
   public:
    virtual ~Client() = default;
    // Shows the source's value; returns the query's status.
    virtual int Refresh(ConditionList& list) = 0;
    // Shows the unit attribute; only for bindings with an attribute view.
    virtual int RefreshUnits(ConditionList&) { return 0; }
  };

  // `className` names the blocker scopes ("QenDsCBut" gives "QenDsCBut::SetDsBaseName").
  DsBinding(Client& client, std::string_view className, bool withAttrView = false);
  ~DsBinding() override;
  DsBinding(const DsBinding&) = delete;
  DsBinding& operator=(const DsBinding&) = delete;

  static void SetDesignMode(bool on);
  static bool IsDesignMode();

  const Dstring& GetDsBaseName() const { return mBaseName; }
  const Dstring& GetDsCmdName() const { return mCmdName; }
  Dstring GetDsName() const { return mBaseName + mCmdName; }
  Dstring GetAttrDsName() const { return GetDsName() + ":ATTR"; }
  bool IsBound() const { return !mBaseName.empty(); }
  bool HasAttrView() const { return mAttrView != nullptr; }
  bool IsInitialised() const { return mInitialised; }
  // The flag word handed to the engine at registration.
  void SetRegistrationFlag(unsigned flag) { mFlag = flag; }

  // After the control is set up: registers when bound. Errors are kept from the caller.
  void NfyInit();
  // Before the control goes: unregisters when bound.
  void NfyEnd();
  // Move the registration to the new name (blocker scope "<class>::SetDsBaseName").
  int SetDsBaseName(const Dstring& text, ConditionList& list);
  int SetDsCmdName(const Dstring& text, ConditionList& list);

  // The bound source, or null (unbound, design mode, or not in the repository).
  QenParamDs* GetDs() const;
  QenParamDs* GetAttrDs() const;
  int Query(bool subCmd, Dstring& out, ConditionList& list);
  // Writes with the wait cursor shown; remembers the text asked for.
  int Write(bool subCmd, const Dstring& text, ConditionList& list);

  // Failed: the source failed, or the control could not read its reply.
  bool IsFailed() const;
  bool IsClashing() const;
  // The text of the last failure of this control's own query or write, empty after success.
  const Dstring& GetLastError() const { return mLastError; }
  // Why the control could not read the reply it got (empty when it could); the control shows
  // as failed meanwhile. Moving the registration clears it.
  void SetReadFailure(const Dstring& why) { mReadFailure = why; }
  const Dstring& GetReadFailure() const { return mReadFailure; }
  // What the control shows on hover: the header, and while failed, why.
  Dstring ToolTip() const;

  int NfyViewRegistered(QenDs* source, ConditionList& list) override;
  int NfyViewDataUpdated(QenDs* source, ConditionList& list) override;

 private:
  class AttrView;

  int Register(ConditionList& list);
  int Unregister(ConditionList& list);
  int Rename(Dstring& attribute, const Dstring& text, const char* op, ConditionList& list);
  void NoteResult(int status, const ConditionList& list, std::size_t before);

  Client& mClient;
  Dstring mClassName;
  Dstring mBaseName;
  Dstring mCmdName;
  Dstring mLastError;
  Dstring mReadFailure;
  unsigned mFlag = 0;
  bool mInitialised = false;
  bool mRegistered = false;
  AttrView* mAttrView = nullptr;
};
