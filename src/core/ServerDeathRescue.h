#pragma once

#include "support/ConditionList.h"
#include "support/Dstring.h"

// The user's unsaved work when the server dies. Installed as what runs before the exit, it
// writes every segment with unsaved work (QenSegmentDs::GetHeldTexts) and the sequence last
// read into a new folder under "<log directory>/rescue" (RescueFolder), and says where in a
// second line of the log and a second message; a folder that cannot be written is said in the
// log, on standard error and in the message, and the exit goes on. The next start of the window
// host offers each folder back once.
class ServerDeathRescue {
 public:
  // From Init to End; the segments keep copies of their unsaved contents meanwhile.
  static void Install();
  static void Uninstall();
  // Writes the rescue, once per installation; nothing when there is nothing unsaved.
  static void AtServerDeath();
  static Dstring Root();
  // Asks for each folder not yet answered, oldest first. Yes puts it back (RescueFolder::PutBack)
  // and keeps the answer only when all of it went back, so a refusal is offered again; No
  // keeps the folder and the answer. What was refused is added to `list`.
  static int OfferPutBack(ConditionList& list);
};
