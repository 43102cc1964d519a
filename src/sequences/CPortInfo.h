#pragma once

#include <vector>

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
// Static: Init creates the sequence and registers both on the dirty-flag source; End undoes it.
class CPortInfo {
 public:
  struct Port {
    Dstring path;
    Dstring portClass;
    Dstring type;
    Dstring model;
    bool operator==(const Port&) const = default;
  };

  static void Init(DirtyFlagDs* dirtyFlag);
  static void End();
  // The one sequence model; null outside Init .. End.
  static CSequence* GetSequence() { return mSequence; }

  // Asks the server for the configuration and takes it; tells the sequence (NfyPortInfo) when
  // a configuration known before has changed since the sequence was last told.
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

 private:
  static int DirtyFlagProc(QenDs* source, void* client, ConditionList& cond);
  static int DirtyFlagMatch(QenDs* source, void* client, const Dstring& name);
  // Asks the server and takes the reply, telling no one.
  static int Fetch(ConditionList& cond);
  static const Port* FindPort(const Dstring& portClass, unsigned long port);

  static CSequence* mSequence;
  static DirtyFlagDs* mDirtyFlag;
  static bool mKnown;
  static bool mUntold;  // changed since the sequence was last told
  static Dstring mMode;
  static Dstring mCentral;
  static std::vector<Port> mPorts;
};
