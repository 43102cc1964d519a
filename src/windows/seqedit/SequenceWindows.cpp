#include "windows/seqedit/SequenceWindows.h"

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
#include "windows/seqedit/SeqeditSeqEdWin.h"

namespace {

template <class T>
QWidget* Open(QWidget* from, const char* resource, const InstanceInfo& info, const QString& title) {
  auto* main = from == nullptr ? nullptr : qobject_cast<MainWin*>(from->window());
  const WindowFactory::Entry* found = WindowFactory::Find(resource);
  // A window that is not on the Windows menu is built here.
  const WindowFactory::Entry entry =
      found != nullptr ? *found
                       : WindowFactory::Entry{resource, title.toStdString(),
                                              [](QWidget* parent, ConditionList& list) -> QWidget* {
                                                auto* window = new T(parent);
                                                if (window->Load(list) == 0) return window;
                                                delete window;
                                                return nullptr;
                                              }};
  if (main == nullptr) return nullptr;
  ConditionList list;
  QWidget* window = InstanceWindows::Open(*main, entry, info, title, list);
  BoundControl::Report(list);
  return window;
}

}  // namespace

QWidget* SequenceWindows::OpenSequence(QWidget* from) {
  // There is one sequence: the editor the Windows menu opened is the one asked for.
  auto* main = from == nullptr ? nullptr : qobject_cast<MainWin*>(from->window());
  const SequenceInstanceInfo info;
  if (main != nullptr && InstanceWindows::Find(*main, info) == nullptr &&
      main->FindWindow(QStringLiteral("seqedit.SeqEdWin"))) {
    return main->OpenWindow(QStringLiteral("seqedit.SeqEdWin"));
  }
  return Open<SeqeditSeqEdWin>(from, "seqedit.SeqEdWin", info, QStringLiteral("Sequence"));
}

QWidget* SequenceWindows::OpenEvents(QWidget* from, unsigned long block) {
  SequenceBlockInstanceInfo info(block);
  info.SetInstanceName(Dstring::Format("Block %lu", block));
  auto* window = qobject_cast<SeqeditEventWin*>(
      Open<SeqeditEventWin>(from, "seqedit.EventWin", info, QStringLiteral("Events of Block %1").arg(block)));
  if (window != nullptr) window->ShowBlock(block);
  return window;
}

QWidget* SequenceWindows::OpenSegment(QWidget* from, unsigned long block, unsigned long port) {
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
  auto* editor = qobject_cast<DataeditSegmentEditWin*>(
      Open<DataeditSegmentEditWin>(from, "dataedit.SegmentEditWin", info,
                                   QStringLiteral("Segment Editor - %1").arg(QString::fromStdString(name))));
  if (editor == nullptr) return nullptr;
  editor->ShowSegment(name, list);
  BoundControl::Report(list);
  return editor;
}
