#pragma once

#include <vector>

#include "sequences/SequencePorts.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

class CSequence;
class DirtyFlagDs;
class QenDs;

// The port information service, as far as the sequence needs it: the system configuration
// that "%s:SGEN:GLOB:CONF?" answers (whether there is a central module, the measurement mode,
// every port with its class and type), and the one sequence model of the application.
//
// The reply, as qensim writes it (docs/sequences.md): "MODE","CENTRAL",(port),(port),...
// where MODE is the measurement mode word ("CAPT" when capturing), CENTRAL the model code of
// the central module or "" when there is none, and each port ("PATH","CLASS","TYPE","MODEL"):
// its header (":CGR1:MOD1:CONN1"), class ("PDAT" data, "PCLK" clock), type ("OUTPUT_PORT",
// "INPUT_PORT" for an analyser port) and module model, in configuration order. Port n of a
// class is the n-th port of that class in that order; sequence port p is data port p.
//
// Static: Init registers on the dirty-flag source and takes the procedure told of a changed
// configuration (the sequence service's); End undoes it.
class CPortInfo {
 public:
  struct Port {
    Dstring path;
    Dstring portClass;
    Dstring type;
    Dstring model;
    bool operator==(const Port&) const = default;
  };

  // Told when a configuration known before has changed; `client` is handed back.
  using ChangeProc = int (*)(void* client, ConditionList& cond);

  static void Init(DirtyFlagDs* dirtyFlag, ChangeProc onChange = nullptr, void* client = nullptr);
  static void End();
  // The one sequence model, forwarded from SequenceService, which owns it: the model is also
  // known by this name. Null outside that service's life.
  static CSequence* GetSequence();

  // Asks the server for the configuration and takes it; calls the change procedure when a
  // configuration known before has changed since it was last called.
  static int Update(ConditionList& cond);
  // Takes a configuration reply without telling anyone (a change is told by the next Update);
  // "GUI_PORTINFO_BAD_CONFIGURATION" and status 1 when it cannot be read, leaving what was known.
  static int SetConfiguration(const Dstring& reply, ConditionList& cond);
  // Forgets the configuration: the next question asks the server again.
  static void Invalidate();
  static bool IsKnown() { return mKnown; }

  // Whether the system has a central module; asks the server first when nothing is known
  // (its conditions are dropped: without an answer there is no central module).
  static bool HasCentral();
  static const Dstring& GetCentralModel() { return mCentral; }
  static const Dstring& GetMode() { return mMode; }
  static const std::vector<Port>& GetPorts() { return mPorts; }
  // The number of ports of a class ("PDAT") in the configuration known.
  static unsigned long GetNumPorts(const Dstring& portClass);
  // The type text of port `port` (from 1) of the class; asks the server first when nothing is
  // known; "GUI_PORTINFO_NO_PORT" and status 1 when there is no such port.
  static int GetPortType(const Dstring& portClass, unsigned long port, Dstring& type, ConditionList& cond);

  static bool NfyMatchDirtyFlag(const Dstring& name);

  // The configuration as the sequence needs it: a SequencePorts::Source.
  static int GetSequencePorts(SequencePorts::Ask ask, SequencePorts& out, ConditionList& cond);

 private:
  static int DirtyFlagProc(QenDs* source, void* client, ConditionList& cond);
  static int DirtyFlagMatch(QenDs* source, void* client, const Dstring& name);
  // Asks the server and takes the reply, telling no one.
  static int Fetch(ConditionList& cond);
  static const Port* FindPort(const Dstring& portClass, unsigned long port);

  static DirtyFlagDs* mDirtyFlag;
  static ChangeProc mOnChange;
  static void* mChangeClient;
  static bool mKnown;
  static bool mUntold;  // changed since the change procedure was last called
  static Dstring mMode;
  static Dstring mCentral;
  static std::vector<Port> mPorts;
};
