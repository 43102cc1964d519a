#include "windows/errstate/ErrStateGridManager.h"

#include <QKeyEvent>

#include "segments/ui/GridDisp.h"
#include "support/NumberText.h"
#include "toolkit/qt/WidgetClassTable.h"
#include "windows/common/PlaceName.h"

ErrStateGridManager::ErrStateGridManager(QWidget* parent) : GridManager(parent) {
  setObjectName(QString::fromLatin1(Class()));
}

void ErrStateGridManager::CppRegister() {
  WidgetClassTable::AddFactory(Class(), [](QWidget* parent) -> QWidget* { return new ErrStateGridManager(parent); });
}

QString ErrStateGridManager::CountText(unsigned long long count) {
  return QString::fromStdString(ErrStateGridModel::CountText(count));
}

void ErrStateGridManager::SetResults(const std::vector<BerSvr::PortResult>& results) {
  mModel.SetResults(results);
  Refresh();
  emit StateChanged();
}

void ErrStateGridManager::Follow() {
  if (mModel.Lines() > 0) ShowLine(mModel.CursorLine());
  Refresh();
  emit StateChanged();
}

void ErrStateGridManager::SetCursor(long line, long channel) {
  if (mModel.Lines() == 0) return;
  mModel.SetCursor(line, channel, ChannelsShown());
  Follow();
}

QString ErrStateGridManager::CursorText() const {
  if (mModel.Lines() == 0) return {};
  const BerSvr::PortResult& port = GetResults()[static_cast<std::size_t>(mModel.CursorLine())];
  if (port.channels.empty()) return PlaceName(port.port);
  const unsigned long long errors = port.channels[static_cast<std::size_t>(mModel.CursorChannel())];
  return QStringLiteral("%1, channel %2: %3 %4")
      .arg(PlaceName(port.port))
      .arg(mModel.CursorChannel())
      .arg(QString::fromStdString(NumberText::Grouped(errors)),
           errors == 1 ? QStringLiteral("error") : QStringLiteral("errors"));
}

long ErrStateGridManager::ChannelsShown() const {
  for (const GridDisp* disp : Disps()) {
    if (disp->GetKind() == GridDisp::Kind::kDigit) return disp->CellsShown();
  }
  return 0;
}

bool ErrStateGridManager::IsTotals(const GridDisp& disp) const { return disp.objectName() == QLatin1String("totals"); }

void ErrStateGridManager::GetNumDigits(long row, long& count) { count = mModel.ChannelsOf(row); }
void ErrStateGridManager::GetDigitOffset(long, long& value) { value = mModel.ChannelOffset(); }

int ErrStateGridManager::SetDigitOffset(long, long first, ConditionList&) {
  mModel.SetChannelOffset(first);
  Refresh();
  return 0;
}

int ErrStateGridManager::GetIsErrorInVector(long row) { return mModel.HasErrors(row) ? 1 : 0; }

long ErrStateGridManager::DispLineCount() const { return mModel.Lines(); }

QString ErrStateGridManager::DispHeader(const GridDisp& disp, int cell) const {
  if (disp.GetKind() != GridDisp::Kind::kDigit) return IsTotals(disp) ? QStringLiteral("Errors") : QStringLiteral("Analyser port");
  const long channel = mModel.ChannelOffset() + cell;
  return channel < mModel.MostChannels() ? QString::number(channel) : QString();
}

GridCell ErrStateGridManager::DispCell(const GridDisp& disp, long line, int cell) const {
  GridCell out;
  const BerSvr::PortResult& port = GetResults()[static_cast<std::size_t>(line)];
  if (disp.GetKind() != GridDisp::Kind::kDigit) {
    out.text =
        IsTotals(disp) ? QString::fromStdString(NumberText::Grouped(port.errors)) : PlaceName(port.port);
    out.marked = IsTotals(disp) && port.errors > 0;
    out.selected = line == mModel.CursorLine();
    return out;
  }
  const long channel = mModel.ChannelOffset() + cell;
  if (channel >= static_cast<long>(port.channels.size())) return out;
  const unsigned long long errors = port.channels[static_cast<std::size_t>(channel)];
  out.text = CountText(errors);
  out.marked = errors > 0;
  out.dim = errors == 0;
  out.cursor = line == mModel.CursorLine() && channel == mModel.CursorChannel();
  return out;
}

void ErrStateGridManager::DispPress(const GridDisp& disp, long line, int cell, Qt::KeyboardModifiers) {
  SetCursor(line, disp.GetKind() == GridDisp::Kind::kDigit ? mModel.ChannelOffset() + cell : mModel.CursorChannel());
}

void ErrStateGridManager::keyPressEvent(QKeyEvent* event) {
  if (GridKey key; CursorKeyOf(event->key(), key)) {
    if (mModel.Lines() > 0) {
      mModel.PressKey(key, VisibleLines(), ChannelsShown());
      Follow();
    }
    event->accept();
    return;
  }
  GridManager::keyPressEvent(event);
}
