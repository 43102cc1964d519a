#pragma once

#include "SimCommandModule.h"
#include "SimSequenceConfig.h"
#include "settings/SettingText.h"

// The instrument's sequencer: the sequence and the ten sequence events, one of each per
// instrument (every handle sees the same), the number of loop levels and the system
// configuration the GUI picks default segments by (docs/simulator.md, "Sequence").
//
//   :SGEN:GLOB:SEQ?  / :SGEN:GLOB:SEQ <expression>        the sequence
//   :SGEN:GLOB:SEQ:EVEN? / :SGEN:GLOB:SEQ:EVEN <expr>     the events (only with a central module)
//   :SGEN:GLOB:SEQ:LLEV?                                   loop levels
//   :SGEN:GLOB:SEQ:ITER:MAX?                               the largest loop count
//   :SGEN:GLOB:CONF?                                       ports and central module
//   :SGEN:GLOB:SEQ:DATA? / :SGEN:GLOB:SEQ:DATA <block>    both as one sequence text
//
// A text is stored as accepted (SimSequenceCheck) and replied as stored; a refused one queues
// its error and changes nothing. A change marks ":SGEN:GLOB:SEQ" (":SGEN:GLOB:SEQ:EVEN") in the
// other handles' dirty flags; a change of the measurement mode marks ":SGEN:GLOB:CONF" in all.
class SimSequence : public SimCommandModule {
 public:
  explicit SimSequence(const SimParamTable& params);

  bool RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) override;
  void Advance(SimContext& context) override;

  const Dstring& GetSequence() const { return mSequence; }
  const SimSequenceConfig& GetConfig() const { return mConfig; }

  // A setting holds the sequence and, with a central module, the events.
  void Capture(SettingText& text) const;
  // 0 when the sequence and events of `text` can be taken as they are; else the SCPI error,
  // with what is wrong and its line in `detail`.
  int Check(const SettingText& text, Dstring& detail) const;
  // Takes the sequence and events of a checked text (ten empty events when it has none).
  void Take(const SettingText& text);
  // The sequence and events at start, for the measurement mode of `params` (a new setting).
  void Reset(const SimParamTable& params);

 private:
  using Handler = void (SimSequence::*)(const SimCommand&, SimContext&);
  struct Entry {
    const char* path;
    Handler handler;
  };
  static const Entry kCommands[];

  void Sequence(const SimCommand& cmd, SimContext& context);
  void Events(const SimCommand& cmd, SimContext& context);
  void LoopLevels(const SimCommand& cmd, SimContext& context);
  void LargestCount(const SimCommand& cmd, SimContext& context);
  void Configuration(const SimCommand& cmd, SimContext& context);
  void Data(const SimCommand& cmd, SimContext& context);
  // Stores an accepted write of `text` into `stored`, marking `header` when it changed.
  void Store(const SimCommand& cmd, SimContext& context, int check, Dstring& stored, const char* header);

  SimSequenceConfig mConfig;
  Dstring mMode;
  Dstring mSequence;
  Dstring mEvents;
};
