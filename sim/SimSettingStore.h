#pragma once

#include <memory>
#include <utility>
#include <vector>

#include "SimCommandModule.h"
#include "SimSettingFile.h"
#include "support/DataParcel.h"

class SimCabling;
class SimSequence;

// The instrument's setting and its two profiles (docs/simulator.md, "Settings and profiles"):
// - a setting is the parameter values (the measurement mode and the port delays among them),
//   the setting profile, the sequence with its events and the connections;
// - ":MMEM:SETT:NEW" starts a new setting: every parameter back at the value the configuration
//   gives it, an empty setting profile, the sequence and connections of the start;
//   ":MMEM:SETT:LOAD" takes a setting file of the data directory, ":MMEM:SETT:SAVE" writes one,
//   ":MMEM:SETT:DATA" sends or takes the setting as its text. A load brings every value back
//   exactly as it was saved, and is all or nothing. After a new or loaded setting every client
//   hears that everything changed.
// - ":CONF:CSET:PROF:EXPR" is the setting profile, one list expression kept with the setting.
// - ":CONF:PROF" holds the system profile's values one by one; they belong to the instrument,
//   not to a setting, and live as long as the server.
class SimSettingStore : public SimCommandModule {
 public:
  // `defaults` is the parameter table as configured, before any client wrote to it; setting
  // files live below `dataDir` (none when it is empty). The sequencer and the connections keep
  // their parts of the setting.
  SimSettingStore(SimParamTable defaults, Dstring dataDir, std::shared_ptr<SimSequence> sequence,
                  std::shared_ptr<SimCabling> connections)
      : mDefaults(std::move(defaults)),
        mDataDir(std::move(dataDir)),
        mSequence(std::move(sequence)),
        mConnections(std::move(connections)) {}

  bool RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) override;

 private:
  using Handler = void (SimSettingStore::*)(const SimCommand&, SimContext&);
  struct Entry {
    const char* path;
    Handler query;
    Handler write;
  };
  static const Entry kCommands[];

  void NewSetting(const SimCommand& cmd, SimContext& context);
  void LoadSetting(const SimCommand& cmd, SimContext& context);
  void SaveSetting(const SimCommand& cmd, SimContext& context);
  void ListSettings(const SimCommand& cmd, SimContext& context);
  void QueryData(const SimCommand& cmd, SimContext& context);
  void WriteData(const SimCommand& cmd, SimContext& context);
  void QuerySettingProfile(const SimCommand& cmd, SimContext& context);
  void WriteSettingProfile(const SimCommand& cmd, SimContext& context);
  void QuerySystemValue(const SimCommand& cmd, SimContext& context);
  void WriteSystemValue(const SimCommand& cmd, SimContext& context);
  void ListSystemValues(const SimCommand& cmd, SimContext& context);

  // The path of the setting file named by the first argument; 0, or the SCPI error.
  int SettingPath(const DataParcel& items, Dstring& path) const;
  // The setting as the instrument holds it now.
  SettingText Capture(SimContext& context) const;
  // Makes the text the current setting: 0, or the SCPI error with nothing changed and what is
  // wrong, with its line, in `detail`.
  int Apply(const SettingText& text, bool cableDelays, SimContext& context, Dstring& detail);
  std::vector<std::pair<Dstring, Dstring>>::iterator FindSystemValue(const Dstring& name);

  SimParamTable mDefaults;
  Dstring mDataDir;
  std::shared_ptr<SimSequence> mSequence;
  std::shared_ptr<SimCabling> mConnections;
  Dstring mSettingProfile;
  // Name and value text, in the order the names were first written.
  std::vector<std::pair<Dstring, Dstring>> mSystemValues;
};
