#include "windows/SequenceWindows.h"

#include "params/ui/BoundControl.h"
#include "segments/QenSegmentPool.h"
#include "sequences/CSequence.h"
#include "sequences/SegmentPortInstanceInfo.h"
#include "sequences/SequenceBlockInstanceInfo.h"
#include "sequences/SequenceInstanceInfo.h"
#include "sequences/SequenceService.h"
#include "support/ConditionListLoader.h"
#include "windows/InstanceWindows.h"
#include "windows/MainWin.h"
#include "windows/dataedit/DataeditSegmentEditWin.h"
#include "windows/seqedit/SeqeditEventWin.h"

namespace {

QWidget* Open(MainWin& main, const char* resource, const InstanceInfo& info, const QString& title) {
  ConditionList list;
  QWidget* window = InstanceWindows::Open(main, resource, info, title, list);
  BoundControl::Report(list);
  return window;
}

}  // namespace

QWidget* SequenceWindows::OpenSequence(MainWin& main) {
  // There is one sequence: the editor the Windows menu opened is the one asked for.
  const SequenceInstanceInfo info;
  if (InstanceWindows::Find(main, info) == nullptr && main.FindWindow(QStringLiteral("seqedit.SeqEdWin"))) {
    return main.OpenWindow(QStringLiteral("seqedit.SeqEdWin"));
  }
  return Open(main, "seqedit.SeqEdWin", info, QStringLiteral("Sequence"));
}

QWidget* SequenceWindows::OpenEvents(MainWin& main, unsigned long block) {
  SequenceBlockInstanceInfo info(block);
  info.SetInstanceName(Dstring::Format("Block %lu", block));
  auto* window = qobject_cast<SeqeditEventWin*>(
      Open(main, "seqedit.EventWin", info, QStringLiteral("Events of Block %1").arg(block)));
  if (window != nullptr) window->ShowBlock(block);
  return window;
}

QWidget* SequenceWindows::OpenSegment(MainWin& main, unsigned long block, unsigned long port) {
  const CSequence* sequence = SequenceService::GetSequence();
  if (sequence == nullptr || sequence->GetType(block, port) != CSequence::SEG_NAMED) return nullptr;
  const Dstring name = sequence->GetSegment(block, port);
  // A name the instrument does not have opens no window: it would make a new, empty segment.
  ConditionList list;
  bool available = false;
  const int status = QenSegmentPool::IsAvailable(name, available, list);
  if (status != 0 || !available) {
    if (status == 0) ConditionListLoader::ConditionToken(list, "GUI_SEGMENTDS_NOT_ON_INSTRUMENT", {name}, 1);
    BoundControl::Report(list);
    return nullptr;
  }
  const SegmentPortInstanceInfo info("PDAT", port, name);
  auto* editor = qobject_cast<DataeditSegmentEditWin*>(Open(
      main, "dataedit.SegmentEditWin", info, QStringLiteral("Segment Editor - %1").arg(QString::fromStdString(name))));
  if (editor == nullptr) return nullptr;
  editor->ShowSegment(name, list);
  BoundControl::Report(list);
  return editor;
}

QWidget* SequenceWindows::ShowSegment(MainWin& main, const Dstring& name) {
  auto* editor = qobject_cast<DataeditSegmentEditWin*>(main.OpenWindow(QStringLiteral("dataedit.SegmentEditWin")));
  if (editor == nullptr) return nullptr;
  ConditionList list;
  editor->ShowSegment(name, list);
  BoundControl::Report(list);
  return editor;
}
