#include "core/ServerDeathRescue.h"

#include <cstdio>
#include <ctime>
#include <filesystem>

#include "core/RescueFolder.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "segments/QenSegmentPool.h"
#include "sequences/CSequence.h"
#include "sequences/SequenceService.h"
#include "support/ConditionListLoader.h"
#include "support/QenEnvironment.h"
#include "toolkit/Toolkit.h"

namespace {

bool gDone = false;

Dstring Stamp(const char* format) {
  const std::time_t now = std::time(nullptr);
  std::tm local{};
  localtime_r(&now, &local);
  char text[32];
  std::strftime(text, sizeof text, format, &local);
  return text;
}

// A folder name not taken yet: the time, then "-2", "-3" … when two deaths share a second.
Dstring NewFolder() {
  const Dstring base = ServerDeathRescue::Root() + "/" + Stamp("%Y-%m-%d_%H-%M-%S");
  Dstring folder = base;
  std::error_code ignored;
  for (int n = 2; std::filesystem::exists(folder.c_str(), ignored); ++n)
    folder = base + Dstring::Format("-%d", n);
  return folder;
}

}  // namespace

void ServerDeathRescue::Install() {
  gDone = false;
  QenSegmentPool::SetKeepCopies(true);
  QenGuiInst::SetBeforeServerDeathExit(&AtServerDeath);
}

void ServerDeathRescue::Uninstall() {
  QenGuiInst::SetBeforeServerDeathExit(nullptr);
  QenSegmentPool::SetKeepCopies(false);
}

Dstring ServerDeathRescue::Root() {
  return QenEnvironment::GetLogDirectory() + "/rescue";
}

// The server is gone: only what this side holds is written, and nothing is asked of the server.
void ServerDeathRescue::AtServerDeath() {
  if (gDone) return;
  gDone = true;
  std::vector<RescueFolder::Segment> segments;
  for (const QenSegmentDs* ds : QenSegmentPool::GetSources()) {
    std::vector<QenSegmentDs::HeldText> texts;
    ds->GetHeldTexts(texts);
    for (QenSegmentDs::HeldText& held : texts) {
      segments.push_back(
          {ds->GetName(), Dstring::Format("segment-%zu.txt", segments.size() + 1), std::move(held)});
    }
  }
  const CSequence* sequence = SequenceService::GetSequence();
  const Dstring expression = sequence != nullptr ? sequence->GetLastExpression() : Dstring();
  if (segments.empty() && expression.empty()) return;
  const Dstring folder = NewFolder();
  const Dstring what = RescueFolder::Summary(segments, !expression.empty());
  ConditionList list;
  if (RescueFolder::Write(folder, Stamp("%Y-%m-%d %H:%M:%S"), segments, expression, list) == 0) {
    QenGuiInst::Log("Unsaved work was written to " + folder + ".\n");
    Toolkit::Get().Alert("The work that was not saved, " + what + ", was written to\n" + folder +
                             "\nThe next start offers to put it back.",
                         ToolkitPort::Icon::Information);
    return;
  }
  const Dstring line = "Unsaved work could not be written to " + folder + ". " +
                       (list.IsEmpty() ? Dstring() : list[0].GetMessage());
  QenGuiInst::Log(line + "\n");
  std::fprintf(stderr, "qengui: %s\n", line.c_str());
  Toolkit::Get().Alert("The work that was not saved, " + what + ", could not be written to\n" + folder +
                           "\n" + (list.IsEmpty() ? Dstring() : list[0].GetMessage()),
                       ToolkitPort::Icon::Critical);
}

int ServerDeathRescue::OfferPutBack(ConditionList& list) {
  int first = 0;
  for (const Dstring& path : RescueFolder::Pending(Root())) {
    RescueFolder folder;
    if (int status = RescueFolder::Read(path, folder, list)) {
      if (first == 0) first = status;
      continue;
    }
    const Dstring question =
        "When the server died at " + folder.GetWritten() + ", the work that was not saved, " +
        folder.Summary() + ", was written to\n" + path +
        "\n\nPut it back on the instrument now? The segments are written and saved under their names, "
        "and the sequence replaces the one the instrument holds.\nNo keeps the folder and does not ask "
        "again.";
    if (Toolkit::Get().AskYesNo(question) != ToolkitPort::kYes) {
      folder.Answer("kept", list);
      continue;
    }
    const int status = folder.PutBack(*SequenceService::GetSequence(), list);
    if (status == QenStatus::kLocked) {
      ConditionListLoader::ConditionToken(list, "GUI_RESCUE_LOCKED", {}, status);
      return status;
    }
    if (status == 0) folder.Answer("put back", list);
    if (first == 0) first = status;
  }
  return first;
}
