#include "windows/errstate/ErrStateGridManager.h"

#include <QKeyEvent>
#include <algorithm>
#include <cmath>

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
  if (count < 10000) return QString::fromStdString(NumberText::Grouped(count));
  static const char kUnits[] = "kMGTPE";
  auto value = static_cast<double>(count);
  int unit = -1;
  while (value >= 999.5 && unit < 5) {
    value /= 1000;
    ++unit;
  }
  const int decimals = value < 9.995 ? 2 : value < 99.95 ? 1 : 0;
  return QString::number(value, 'f', decimals) + QLatin1Char(kUnits[unit]);
}

void ErrStateGridManager::SetResults(const std::vector<BerSvr::PortResult>& results) {
  mResults = results;
  mLine = std::clamp(mLine, 0L, std::max(0L, DispLineCount() - 1));
  mChannel = std::clamp(mChannel, 0L, std::max(0L, ChannelsOf(mLine) - 1));
  Refresh();
  emit StateChanged();
}

void ErrStateGridManager::SetCursor(long line, long channel) {
  if (mResults.empty()) return;
  mLine = std::clamp(line, 0L, DispLineCount() - 1);
  mChannel = std::clamp(channel, 0L, std::max(0L, ChannelsOf(mLine) - 1));
  const long shown = std::max(1L, ChannelsShown());
  if (mChannel < mChannelOffset) mChannelOffset = mChannel;
  if (mChannel >= mChannelOffset + shown) mChannelOffset = mChannel - shown + 1;
  ShowLine(mLine);
  Refresh();
  emit StateChanged();
}

QString ErrStateGridManager::CursorText() const {
  if (mResults.empty()) return {};
  const BerSvr::PortResult& port = mResults[static_cast<std::size_t>(mLine)];
  if (port.channels.empty()) return PlaceName(port.port);
  const unsigned long long errors = port.channels[static_cast<std::size_t>(mChannel)];
  return QStringLiteral("%1, channel %2: %3 %4")
      .arg(PlaceName(port.port))
      .arg(mChannel)
      .arg(QString::fromStdString(NumberText::Grouped(errors)),
           errors == 1 ? QStringLiteral("error") : QStringLiteral("errors"));
}

long ErrStateGridManager::ChannelsOf(long line) const {
  if (line < 0 || line >= DispLineCount()) return 0;
  return static_cast<long>(mResults[static_cast<std::size_t>(line)].channels.size());
}

long ErrStateGridManager::MostChannels() const {
  long most = 0;
  for (long line = 0; line < DispLineCount(); ++line) most = std::max(most, ChannelsOf(line));
  return most;
}

long ErrStateGridManager::ChannelsShown() const {
  for (const GridDisp* disp : Disps()) {
    if (disp->GetKind() == GridDisp::Kind::kDigit) return disp->CellsShown();
  }
  return 0;
}

bool ErrStateGridManager::IsTotals(const GridDisp& disp) const { return disp.objectName() == QLatin1String("totals"); }

void ErrStateGridManager::GetNumDigits(long row, long& count) { count = ChannelsOf(row); }
void ErrStateGridManager::GetDigitOffset(long, long& value) { value = mChannelOffset; }

int ErrStateGridManager::SetDigitOffset(long, long first, ConditionList&) {
  mChannelOffset = std::clamp(first, 0L, std::max(0L, MostChannels() - 1));
  Refresh();
  return 0;
}

int ErrStateGridManager::GetIsErrorInVector(long row) {
  return row >= 0 && row < DispLineCount() && mResults[static_cast<std::size_t>(row)].errors > 0 ? 1 : 0;
}

long ErrStateGridManager::DispLineCount() const { return static_cast<long>(mResults.size()); }

QString ErrStateGridManager::DispHeader(const GridDisp& disp, int cell) const {
  if (disp.GetKind() != GridDisp::Kind::kDigit) return IsTotals(disp) ? QStringLiteral("Errors") : QStringLiteral("Analyser port");
  const long channel = mChannelOffset + cell;
  return channel < MostChannels() ? QString::number(channel) : QString();
}

GridCell ErrStateGridManager::DispCell(const GridDisp& disp, long line, int cell) const {
  GridCell out;
  const BerSvr::PortResult& port = mResults[static_cast<std::size_t>(line)];
  if (disp.GetKind() != GridDisp::Kind::kDigit) {
    out.text =
        IsTotals(disp) ? QString::fromStdString(NumberText::Grouped(port.errors)) : PlaceName(port.port);
    out.marked = IsTotals(disp) && port.errors > 0;
    out.selected = line == mLine;
    return out;
  }
  const long channel = mChannelOffset + cell;
  if (channel >= static_cast<long>(port.channels.size())) return out;
  const unsigned long long errors = port.channels[static_cast<std::size_t>(channel)];
  out.text = CountText(errors);
  out.marked = errors > 0;
  out.dim = errors == 0;
  out.cursor = line == mLine && channel == mChannel;
  return out;
}

void ErrStateGridManager::DispPress(const GridDisp& disp, long line, int cell, Qt::KeyboardModifiers) {
  SetCursor(line, disp.GetKind() == GridDisp::Kind::kDigit ? mChannelOffset + cell : mChannel);
}

void ErrStateGridManager::keyPressEvent(QKeyEvent* event) {
  const long page = std::max(1L, VisibleLines() - 1);
  switch (event->key()) {
    case Qt::Key_Up: SetCursor(mLine - 1, mChannel); break;
    case Qt::Key_Down: SetCursor(mLine + 1, mChannel); break;
    case Qt::Key_Left: SetCursor(mLine, mChannel - 1); break;
    case Qt::Key_Right: SetCursor(mLine, mChannel + 1); break;
    case Qt::Key_Home: SetCursor(mLine, 0); break;
    case Qt::Key_End: SetCursor(mLine, ChannelsOf(mLine) - 1); break;
    case Qt::Key_PageUp: SetCursor(mLine - page, mChannel); break;
    case Qt::Key_PageDown: SetCursor(mLine + page, mChannel); break;
    default: GridManager::keyPressEvent(event); return;
  }
  event->accept();
}
