#include "segments/ui/SegmentGridManager.h"

#include <QClipboard>
#include <QGuiApplication>
#include <QKeyEvent>
#include <QPainter>

#include "instrument/QenGuiInst.h"
#include "segments/ui/GridDisp.h"
#include "support/FWBlocker.h"
#include "toolkit/qt/WidgetClassTable.h"

namespace {

QString TextOf(const ConditionList& list) { return QString::fromStdString(list.ToText()).trimmed(); }

}  // namespace

SegmentGridManager::SegmentGridManager(QWidget* parent) : GridManager(parent) {
  setObjectName(QString::fromLatin1(Class()));
  mModel.SetObserver(this);
}

// A grid that goes must let go of the segment whatever happens: what could not be written is said.
SegmentGridManager::~SegmentGridManager() {
  ConditionList list;
  if (mModel.Release(list) != 0) {
    QenGuiInst::ShowErrorDlg(list, 1);
    mModel.Abandon();
  }
  mModel.SetObserver(nullptr);
}

void SegmentGridManager::CppRegister() {
  WidgetClassTable::AddFactory(Class(), [](QWidget* parent) -> QWidget* { return new SegmentGridManager(parent); });
}

int SegmentGridManager::Shown(int status) {
  Repaint();
  emit StateChanged();
  return status;
}

void SegmentGridManager::Said(int status, const ConditionList& list) {
  if (status != 0) emit Message(status == FWBlocker::kLocked ? LockedText() : TextOf(list));
}

long SegmentGridManager::DigitCellsShown() const {
  for (const GridDisp* disp : Disps()) {
    if (disp->GetKind() == GridDisp::Kind::kDigit) return disp->CellsShown();
  }
  return 0;
}

void SegmentGridManager::NfySegmentChanged(bool elsewhere) {
  if (elsewhere) {
    emit ChangedElsewhere();
  } else {
    Refresh();
  }
  emit StateChanged();
}

void SegmentGridManager::NfyMessage(const Dstring& text) { emit Message(QString::fromStdString(text).trimmed()); }

QString SegmentGridManager::LockedText() {
  return QStringLiteral("Another client holds the instrument: nothing was changed, and your edits are kept.");
}

int SegmentGridManager::Release(ConditionList& list) {
  if (mModel.GetSegmentDs() == nullptr) return 0;
  return Shown(mModel.Release(list));
}

int SegmentGridManager::HookOn(long, long, const Dstring& segment, ConditionList& list) {
  return Shown(mModel.HookOn(segment, list));
}

int SegmentGridManager::DeleteTraces(ConditionList& list) { return mModel.DeleteTraces(list); }
int SegmentGridManager::ImportText(const Dstring& path, ConditionList& list) { return Shown(mModel.ImportText(path, list)); }

int SegmentGridManager::PasteText(ConditionList& list) {
  return Shown(mModel.PasteText(QGuiApplication::clipboard()->text().toStdString(), list));
}

int SegmentGridManager::ValidateSbDigit(ConditionList& list) { return SetDigitOffset(0, mModel.DigitOffset(), list); }
int SegmentGridManager::ValidateSbAddr(ConditionList& list) { return SetVectorOffset(0, mModel.FirstLine(), list); }
int SegmentGridManager::MoveToError(ERR_DIR direction, ConditionList& list) { return Shown(mModel.MoveToError(direction, list)); }
bool SegmentGridManager::CanMoveToError(ERR_DIR) { return mModel.CanMoveToError(); }
bool SegmentGridManager::CanShowGoto() { return mModel.CanShowGoto(); }

int SegmentGridManager::GoToVectorTrace(long vector, long trace, ConditionList& list) {
  return Shown(mModel.GoToVectorTrace(vector, trace, list));
}

int SegmentGridManager::GetIsErrorInVector(long vector, bool& error, ConditionList& list) {
  return mModel.GetIsErrorInVector(vector, error, list);
}

void SegmentGridManager::GetNumDigits(long, long& count) { count = mModel.Digits(); }
void SegmentGridManager::GetNumVectors(long, long& count) { count = mModel.Length(); }
long SegmentGridManager::GetNumDispVectors(long) { return std::min(mModel.Length() - mModel.FirstLine(), VisibleLines()); }
long SegmentGridManager::GetNumDispDigits(long) {
  return std::min(DigitCellsShown(), mModel.Digits() - mModel.DigitOffset());
}
int SegmentGridManager::GetDataFormat(long) { return static_cast<int>(mModel.GetDataFormat()); }

int SegmentGridManager::SetDataFormat(long, DataFormat format, ConditionList& list) {
  return Shown(mModel.SetDataFormat(format, list));
}

int SegmentGridManager::SetAddrFormat(AddrFormat format, ConditionList&) {
  mModel.SetAddrFormat(format);
  Refresh();
  return 0;
}

int SegmentGridManager::GetSegmentProperties(long, long, SegmentProperties& properties, ConditionList& list) {
  return mModel.GetSegmentProperties(properties, list);
}

int SegmentGridManager::GetSegmentName(long, long, Dstring& name, ConditionList&) {
  name = mModel.GetSegmentName();
  return 0;
}

int SegmentGridManager::SaveSegment(long, long, ConditionList& list) { return Shown(mModel.SaveSegment(list)); }

int SegmentGridManager::SaveSegmentAs(long, long, const Dstring& name, ConditionList& list) {
  return Shown(mModel.SaveSegmentAs(name, list));
}

int SegmentGridManager::SetVectorOffset(long, long first, ConditionList& list) {
  const int status = mModel.SetVectorOffset(first, list);
  Refresh();
  return status;
}

int SegmentGridManager::SetDigitOffset(long, long first, ConditionList&) {
  mModel.SetDigitOffset(first);
  Refresh();
  return 0;
}

int SegmentGridManager::ResetSelection(ConditionList&) { return Shown(mModel.ResetSelection()); }

int SegmentGridManager::SetSelection(long, long firstVector, long lastVector, long firstDigit, long lastDigit, long,
                                     ConditionList& list) {
  return Shown(mModel.SetSelection(firstVector, lastVector, firstDigit, lastDigit, list));
}

int SegmentGridManager::SetVectorSelection(long, long first, long last, ConditionList& list) {
  return Shown(mModel.SetVectorSelection(first, last, list));
}

int SegmentGridManager::SetDigitSelection(long, long first, long last, ConditionList& list) {
  return Shown(mModel.SetDigitSelection(first, last, list));
}

int SegmentGridManager::FindPattern(FindDirection direction, VectorTrace what, ConditionList& list) {
  return Shown(mModel.FindPattern(direction, what, list));
}

int SegmentGridManager::ModifyFill(ConditionList& list) { return mModel.ModifyFill(list); }
int SegmentGridManager::ModifyInvert(ConditionList& list) { return mModel.ModifyInvert(list); }
int SegmentGridManager::ModifyMirror(MirrorMode mode, ConditionList& list) { return mModel.ModifyMirror(mode, list); }

int SegmentGridManager::ModifyCopy(ConditionList& list) {
  Dstring text;
  const int status = mModel.ModifyCopy(text, list);
  if (status == 0 && mModel.IsCopyPossible()) QGuiApplication::clipboard()->setText(QString::fromStdString(text));
  return status;
}

int SegmentGridManager::ModifyPaste(ConditionList& list) { return mModel.ModifyPaste(list); }

int SegmentGridManager::ModifyInsert(VectorTrace what, InsertMode mode, long count, ConditionList& list) {
  return mModel.ModifyInsert(what, mode, count, list);
}

int SegmentGridManager::ModifyDelete(ConditionList& list) { return mModel.ModifyDelete(list); }
int SegmentGridManager::ModifySerialize(Direction direction, ConditionList& list) { return mModel.ModifySerialize(direction, list); }

int SegmentGridManager::ModifyDeserialize(long width, long offset, ConditionList& list) {
  return mModel.ModifyDeserialize(width, offset, list);
}

int SegmentGridManager::ModifyCoding(ConditionList& list) { return mModel.ModifyCoding(list); }

void SegmentGridManager::DispScrollTo(long firstLine) {
  ConditionList list;
  Said(mModel.ScrollTo(firstLine, list), list);
}

QString SegmentGridManager::DispHeader(const GridDisp& disp, int cell) const {
  if (disp.GetKind() != GridDisp::Kind::kDigit) return disp.GetKind() == GridDisp::Kind::kAddr ? QStringLiteral("Vector") : QString();
  return QString::fromStdString(mModel.ColumnHeader(mModel.DigitOffset() + cell));
}

GridCell SegmentGridManager::DispCell(const GridDisp& disp, long line, int cell) const {
  GridCell out;
  if (disp.GetKind() == GridDisp::Kind::kAddr) {
    out.text = QString::fromStdString(mModel.AddressText(line));
    out.selected = line == mModel.CursorVector();
    return out;
  }
  if (disp.GetKind() != GridDisp::Kind::kDigit) return out;
  const SegmentGridModel::Cell c = mModel.CellAt(line, mModel.DigitOffset() + cell);
  out.cursor = c.cursor;
  out.selected = c.selected;
  if (c.text != 0) out.text = QString(QChar::fromLatin1(c.text));
  out.marked = c.text == '!';
  return out;
}

void SegmentGridManager::DispPaint(const GridDisp& disp, QPainter& painter, const QRect& area) const {
  GridManager::DispPaint(disp, painter, area);
  if (disp.GetKind() != GridDisp::Kind::kDigit || IsEditable()) return;
  const QString hint = GetSegmentDs() == nullptr
                           ? QStringLiteral("Choose a segment from the list, or make one with New…")
                           : QStringLiteral("The segment has no vectors: Edit > Insert Vectors… adds some.");
  painter.setPen(disp.palette().color(QPalette::Disabled, QPalette::Text));
  painter.drawText(disp.rect().adjusted(12, GetOffY() + 12, -12, -12), Qt::AlignLeft | Qt::AlignTop | Qt::TextWordWrap, hint);
}

int SegmentGridManager::DispGap(const GridDisp& disp, int cell) const {
  if (disp.GetKind() != GridDisp::Kind::kDigit) return 0;
  return mModel.EndsGroup(mModel.DigitOffset() + cell) ? GetDX() / 2 : 0;
}

void SegmentGridManager::DispPress(const GridDisp& disp, long line, int cell, Qt::KeyboardModifiers modifiers) {
  const bool extend = (modifiers & Qt::ShiftModifier) != 0;
  if (disp.GetKind() == GridDisp::Kind::kDigit) {
    mModel.PressCell(line, mModel.DigitOffset() + cell, extend);
  } else {
    ConditionList list;
    Said(mModel.PressAddress(line, extend, list), list);
  }
  Shown(0);
}

void SegmentGridManager::DispMove(const GridDisp& disp, long line, int cell) {
  if (disp.GetKind() != GridDisp::Kind::kDigit) return;
  mModel.PressCell(line, mModel.DigitOffset() + cell, true);
  Shown(0);
}

void SegmentGridManager::keyPressEvent(QKeyEvent* event) {
  const Qt::KeyboardModifiers modifiers = event->modifiers();
  if (GridKey key; CursorKeyOf(event->key(), key)) {
    if (mModel.IsEditable()) {
      mModel.PressKey(key, (modifiers & Qt::ShiftModifier) != 0, (modifiers & Qt::ControlModifier) != 0);
      Shown(0);
    }
    event->accept();
    return;
  }
  if (event->key() == Qt::Key_Escape) {
    Shown(mModel.ResetSelection());
    event->accept();
    return;
  }
  const QString text = event->text();
  // Keys with Ctrl, Alt or Meta are commands (menus, shortcuts), never typed.
  const bool command = (modifiers & (Qt::ControlModifier | Qt::AltModifier | Qt::MetaModifier)) != 0;
  if (text.size() != 1 || !text[0].isPrint() || command) {
    GridManager::keyPressEvent(event);
    return;
  }
  if (mModel.IsEditable()) {
    ConditionList list;
    const int status = mModel.Type(text[0].toLatin1(), list);
    Said(status, list);
    Shown(0);
  }
  event->accept();
}

void SegmentGridManager::resizeEvent(QResizeEvent* event) {
  GridManager::resizeEvent(event);
  ConditionList list;
  Said(mModel.CoverShown(list), list);
}
