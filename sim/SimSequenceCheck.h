#pragma once

#include <string_view>

#include "SimSequenceConfig.h"
#include "support/Dstring.h"

// What the simulated sequencer accepts (docs/simulator.md, "Sequence"). Every text is read
// with the project's parser; a check returns 0, or the SCPI error to queue:
//  -104 the text is not a sequence (or event) expression: it does not parse, or an element
//       has the wrong shape or item type;
//  -224 a well-formed expression this instrument cannot play: a version outside 2.0 .. 3.0
//       (events: above 3.0), a block whose number of segments is not the number of data
//       ports, a segment keyword it does not know, a loop level outside 1 .. its loop levels,
//       or a loop holding a loop of its own level or a higher one;
//  -222 a loop count above kMaxLoopCount.
class SimSequenceCheck {
 public:
  // The most times the sequencer repeats a counted loop (":SGEN:GLOB:SEQ:ITER:MAX?").
  static constexpr unsigned long kMaxLoopCount = 1048576;

  static int CheckSequence(std::string_view text, unsigned long dataPorts, unsigned long loopLevels);
  static int CheckEvents(std::string_view text);

  // One block of the default length, each data port playing its default kind: PAUSE0 on an
  // analyser port, else ACQUIRE when the mode is CAPT and PAUSE otherwise.
  static Dstring InitialSequence(const SimSequenceConfig& config, const Dstring& mode);
  // Ten empty events.
  static Dstring InitialEvents();
};
