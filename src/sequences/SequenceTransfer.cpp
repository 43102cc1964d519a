#include "sequences/SequenceTransfer.h"

#include "sequences/CPortInfo.h"
#include "sequences/CSequence.h"
#include "sequences/CSequenceEvents.h"
#include "sequences/SequenceService.h"
#include "settings/SettingTransfer.h"
#include "support/ConditionListLoader.h"

namespace {

using Kind = SettingText::Kind;

int Refuse(ConditionList& list, const Dstring& path, int line, const Dstring& what) {
  ConditionListLoader::ConditionToken(list, "GUI_SETTING_TEXT_LINE", {path, Dstring::Format("%d", line), what}, 1);
  return 1;
}

Dstring FirstMessage(const ConditionList& list) { return list.IsEmpty() ? Dstring() : list[0].GetMessage(); }

// What the model and the event table make of the text, without touching either.
int Check(const SettingText& text, const Dstring& path, ConditionList& list) {
  CSequence sequence;
  ConditionList why;
  if (sequence.fromExpression(text.GetSequence(), why) != 0) {
    return Refuse(list, path, text.GetSequenceLine(), "the sequence cannot be read: " + FirstMessage(why));
  }
  if (!text.HasEvents()) return 0;
  if (!CPortInfo::HasCentral()) {
    return Refuse(list, path, text.GetEventsLine(), "this instrument has no central module to take sequence events");
  }
  CSequenceEvents events;
  if (events.FromExpression(text.GetEvents(), why) != 0) {
    return Refuse(list, path, text.GetEventsLine(), "the events cannot be read: " + FirstMessage(why));
  }
  return 0;
}

}  // namespace

int SequenceTransfer::Export(const Dstring& path, ConditionList& list) {
  return SettingTransfer::Export(Kind::kSequence, path, list);
}

int SequenceTransfer::Import(const Dstring& path, ConditionList& list) {
  SettingText text(Kind::kSequence);
  int status = SettingTransfer::ReadFile(Kind::kSequence, path, text, list);
  if (status == 0) status = Check(text, path, list);
  if (status == 0) status = SettingTransfer::Send(text, false, list);
  if (status != 0) {
    SettingTransfer::SayNotImported(Kind::kSequence, path, status, list);
    return status;
  }
  // The instrument tells other clients of the change, not the one that made it.
  CSequence* sequence = SequenceService::GetSequence();
  return sequence != nullptr ? sequence->ReadSequence(list, 0) : 0;
}
