#pragma once

#include <QWidget>
#include <memory>

#include "capture/CaptureData.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

class QComboBox;
class QLabel;
class QScrollBar;
class QSpinBox;
class TaskFollower;
class WaveView;

namespace Ui {
class WaveWin;
}

// The waveform window ("wavewin.WaveWin"): what an analyser port captured, as bit traces, a bus
// and the error vectors, with two cursors and their distance in vectors and in time. A capture
// (":CAPT", an InstrumentTask) needs a running instrument; when it is done the chosen port's
// capture is read once into the window, which holds it as the only copy. It is exported as a
// Value Change Dump, between the cursors when both are set.
class WavewinWaveWin : public QWidget {
  Q_OBJECT

 public:
  explicit WavewinWaveWin(QWidget* parent = nullptr);
  ~WavewinWaveWin() override;

  int Load(ConditionList& list);
  // Reads the chosen port's last capture.
  int ReadCapture(ConditionList& list);
  int ExportVcd(const Dstring& path, ConditionList& list) const;

  const CaptureData& Data() const { return mData; }
  WaveView* View() const { return mView; }
  TaskFollower* Follower() const { return mFollower; }
  Dstring Port() const;
  QString CursorText() const;
  QString StateText() const;

 private:
  int CheckRunning(ConditionList& list) const;
  void AddPorts();
  void ShowCapture(const QString& emptyText);
  void ShowCursors();
  void ApplyBus();
  void FollowView();
  void HitPButExport();
  void HitPButError(bool forward);
  void Read();

  CaptureData mData;
  WaveView* mView = nullptr;
  QScrollBar* mScroll = nullptr;
  QComboBox* mPort = nullptr;
  QComboBox* mRadix = nullptr;
  QSpinBox* mBusLow = nullptr;
  QSpinBox* mBusHigh = nullptr;
  QLabel* mState = nullptr;
  QLabel* mCursors = nullptr;
  QLabel* mSummary = nullptr;
  TaskFollower* mFollower = nullptr;
  std::unique_ptr<Ui::WaveWin> mUi;
};
