#include "windows/wavewin/WavewinWaveWin.h"

#include <QComboBox>
#include <QDateTime>
#include <QFileDialog>
#include <QLabel>
#include <QLayout>
#include <QProgressBar>
#include <QPushButton>
#include <QScrollBar>
#include <QSpinBox>
#include <cmath>

#include "capture/CaptureReader.h"
#include "capture/VcdWriter.h"
#include "capture/ui/WaveView.h"
#include "core/uiapp.h"
#include "data/RunStopDs.h"
#include "params/ui/BoundControl.h"
#include "sequences/CPortInfo.h"
#include "support/ConditionListLoader.h"
#include "support/NumberText.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "windows/common/PlaceName.h"
#include "windows/common/TaskFollower.h"
#include "ui_wavewin.WaveWin.h"

namespace {

const QString kNoCapture = QStringLiteral("No capture yet. Start the instrument (Run, F5) and press Capture.");

// A time with four significant digits in the unit that suits it.
QString TimeText(double seconds) {
  static const std::pair<double, const char*> kUnits[] = {{1, "s"}, {1e-3, "ms"}, {1e-6, "µs"}, {1e-9, "ns"}, {1e-12, "ps"}};
  const double magnitude = std::fabs(seconds);
  for (const auto& [scale, unit] : kUnits) {
    if (magnitude >= scale || scale == 1e-12) {
      return QString::number(seconds / scale, 'g', 4) + QChar(0x202F) + QString::fromUtf8(unit);
    }
  }
  return {};
}

}  // namespace

WavewinWaveWin::WavewinWaveWin(QWidget* parent) : QWidget(parent), mUi(std::make_unique<Ui::WaveWin>()) { setObjectName(QStringLiteral("WavewinWaveWin")); }

WavewinWaveWin::~WavewinWaveWin() {
  // The view draws the capture this window holds: it goes first.
  delete mView;
}

int WavewinWaveWin::Load(ConditionList&) {
  mUi->setupUi(this);
  ResourceLibrary::InitWidgets(this);
  auto* area = mUi->WaveArea;
  auto* bar = mUi->BarProgress;
  auto* capture = mUi->PButCapture;
  auto* cancel = mUi->PButCancel;
  mPort = mUi->CBoxPort;
  mRadix = mUi->CBoxRadix;
  mBusLow = mUi->SpinBusLow;
  mBusHigh = mUi->SpinBusHigh;
  mState = mUi->LabelState;
  mCursors = mUi->LabelCursors;
  mSummary = mUi->LabelSummary;
  mView = new WaveView(area);
  mScroll = new QScrollBar(Qt::Horizontal, area);
  mScroll->setObjectName(QStringLiteral("ScrollWave"));
  area->layout()->addWidget(mView);
  area->layout()->addWidget(mScroll);
  connect(mView, &WaveView::ViewChanged, this, &WavewinWaveWin::FollowView);
  connect(mView, &WaveView::CursorsChanged, this, &WavewinWaveWin::ShowCursors);
  connect(mScroll, &QScrollBar::valueChanged, this, [this](int value) {
    if (std::lround(mView->GetFirst()) != value) mView->SetFirst(value);
  });
  connect(mBusLow, &QSpinBox::valueChanged, this, &WavewinWaveWin::ApplyBus);
  connect(mBusHigh, &QSpinBox::valueChanged, this, &WavewinWaveWin::ApplyBus);
  connect(mRadix, &QComboBox::currentIndexChanged, this, &WavewinWaveWin::ApplyBus);
  connect(mUi->PButExport, &QPushButton::clicked, this, &WavewinWaveWin::HitPButExport);
  connect(mUi->PButNextError, &QPushButton::clicked, this, [this] { HitPButError(true); });
  connect(mUi->PButPreviousError, &QPushButton::clicked, this, [this] { HitPButError(false); });
  connect(mUi->PButFit, &QPushButton::clicked, mView, &WaveView::Fit);

  TaskFollower::Hooks hooks;
  hooks.before = [this](ConditionList& l) {
    const int status = CheckRunning(l);
    if (status != 0) mState->setText(QStringLiteral("Not captured: nothing runs."));
    return status;
  };
  hooks.running = [this](const InstrumentTask::Progress& p) {
    mState->setText(QStringLiteral("Capturing: %1 of %2 analyser ports read out…").arg(p.done).arg(p.total));
  };
  hooks.ended = [this](const InstrumentTask::Progress& p) {
    if (p.state == InstrumentTask::State::Aborted) {
      mState->setText(QStringLiteral("Cancelled; the last capture is kept."));
      return;
    }
    Read();
    if (mData.GetLength() > 0) mState->setText(QStringLiteral("Captured at %1.").arg(QTime::currentTime().toString()));
  };
  hooks.say = [this](const QString& text) { mState->setText(text); };
  mFollower = new TaskFollower(InstrumentTask(":CAPT"), bar, capture, cancel, hooks, this);
  AddPorts();
  connect(mPort, &QComboBox::currentIndexChanged, this, &WavewinWaveWin::Read);
  ShowCapture(mPort->count() == 0 ? QStringLiteral("This configuration has no analyser ports.") : kNoCapture);
  mFollower->Resume();
  return 0;
}

void WavewinWaveWin::AddPorts() {
  ConditionList ignored;
  if (!CPortInfo::IsKnown()) CPortInfo::Update(ignored);
  for (const CPortInfo::Port& port : CPortInfo::GetPorts()) {
    if (port.portClass == "PDAT" && port.type == "INPUT_PORT") {
      mPort->addItem(PlaceName(port.path), QString::fromStdString(port.path));
    }
  }
  mPort->setEnabled(mPort->count() > 0);
}

Dstring WavewinWaveWin::Port() const { return mPort->currentData().toString().toStdString(); }

int WavewinWaveWin::CheckRunning(ConditionList& list) const {
  if (uiapp::GetRunStopDs() != nullptr && uiapp::GetRunStopDs()->IsRunning()) return 0;
  ConditionListLoader::ConditionToken(list, "GUI_CAPTURE_NOT_RUNNING", {}, 1);
  return 1;
}

int WavewinWaveWin::ReadCapture(ConditionList& list) {
  if (mPort->count() == 0) return 0;
  // The view lets go of the old capture before it is replaced.
  mView->SetData(nullptr, QStringLiteral("Reading the capture…"));
  const int status = CaptureReader::Read(Port(), mData, list);
  ShowCapture(status == 0 ? kNoCapture : QStringLiteral("The capture could not be read; see the error list."));
  return status;
}

void WavewinWaveWin::Read() {
  ConditionList list;
  ReadCapture(list);
  BoundControl::Report(list);
}

void WavewinWaveWin::ShowCapture(const QString& emptyText) {
  const long width = mData.GetWidth();
  for (QSpinBox* spin : {mBusLow, mBusHigh}) {
    const QSignalBlocker block(spin);
    spin->setRange(0, static_cast<int>(std::max(0L, width - 1)));
    spin->setEnabled(width > 1);
  }
  {
    const QSignalBlocker block(mBusHigh);
    mBusHigh->setValue(static_cast<int>(std::min(width - 1, mBusLow->value() + 7L)));
  }
  mView->SetData(&mData, emptyText);
  ApplyBus();
  if (mData.GetLength() == 0) {
    mSummary->clear();
    return;
  }
  mSummary->setText(QStringLiteral("%1 vectors × %2 traces · clock period %3 · %4 error vectors")
                        .arg(QString::fromStdString(NumberText::Grouped(mData.GetLength())))
                        .arg(width)
                        .arg(TimeText(mData.GetPeriod()))
                        .arg(QString::fromStdString(NumberText::Grouped(mData.ErrorVectors()))));
}

void WavewinWaveWin::ApplyBus() {
  // A single trace needs no bus; a bus is at most 64 traces.
  const long low = mBusLow->value();
  const long high = std::min<long>(mBusHigh->value(), low + 63);
  const int radix[] = {16, 10, 2};
  mView->SetBus(mData.GetWidth() > 1 ? low : 1, mData.GetWidth() > 1 ? high : 0, radix[std::max(0, mRadix->currentIndex())]);
}

void WavewinWaveWin::FollowView() {
  const long length = mData.GetLength();
  const QSignalBlocker block(mScroll);
  const auto visible = static_cast<long>(mView->VisibleVectors());
  mScroll->setRange(0, static_cast<int>(std::max(0L, length - visible)));
  mScroll->setPageStep(static_cast<int>(std::max(1L, visible)));
  mScroll->setSingleStep(static_cast<int>(std::max(1L, visible / 8)));
  mScroll->setValue(static_cast<int>(std::lround(mView->GetFirst())));
}

QString WavewinWaveWin::CursorText() const { return mCursors->text(); }
QString WavewinWaveWin::StateText() const { return mState->text(); }

void WavewinWaveWin::ShowCursors() {
  const long a = mView->GetCursor(0);
  const long b = mView->GetCursor(1);
  const double period = mData.GetPeriod();
  QStringList parts;
  if (a >= 0)
    parts << QStringLiteral("A: %1 (%2)")
                 .arg(QString::fromStdString(NumberText::Grouped(a)),
                      TimeText(static_cast<double>(a) * period));
  if (b >= 0)
    parts << QStringLiteral("B: %1 (%2)")
                 .arg(QString::fromStdString(NumberText::Grouped(b)),
                      TimeText(static_cast<double>(b) * period));
  if (a >= 0 && b >= 0) {
    parts << QStringLiteral("B − A: %1 vectors = %2")
                 .arg(QString::fromStdString(NumberText::Grouped(b - a)),
                      TimeText(static_cast<double>(b - a) * period));
  }
  mCursors->setText(parts.isEmpty() ? QStringLiteral("Click to set cursor A, right-click for cursor B.")
                                    : parts.join(QStringLiteral("    ")));
}

void WavewinWaveWin::HitPButError(bool forward) {
  if (!mView->GoToError(forward)) {
    mState->setText(forward ? QStringLiteral("No error after cursor A.") : QStringLiteral("No error before cursor A."));
  }
}

int WavewinWaveWin::ExportVcd(const Dstring& path, ConditionList& list) const {
  if (mData.GetLength() == 0) {
    ConditionListLoader::ConditionToken(list, "GUI_CAPTURE_EMPTY", {}, 1);
    return 1;
  }
  VcdWriter::Range range{0, mData.GetLength(), mBusLow->value(), mData.GetWidth() > 1 ? mBusHigh->value() : -1};
  const long a = mView->GetCursor(0);
  const long b = mView->GetCursor(1);
  if (a >= 0 && b >= 0 && a != b) {
    range.from = std::min(a, b);
    range.to = std::max(a, b) + 1;
  }
  return VcdWriter::WriteFile(mData, Port(), range, path, list);
}

void WavewinWaveWin::HitPButExport() {
  const QString path = QFileDialog::getSaveFileName(this, QStringLiteral("Export VCD"), QStringLiteral("capture.vcd"),
                                                    QStringLiteral("Value Change Dump (*.vcd);;All files (*)"));
  if (path.isEmpty()) return;
  ConditionList list;
  if (ExportVcd(path.toStdString(), list) == 0) mState->setText(QStringLiteral("Exported to %1.").arg(path));
  BoundControl::Report(list);
}
