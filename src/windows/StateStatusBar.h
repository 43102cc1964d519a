#pragma once

#include <QStatusBar>
#include <memory>
#include <vector>

class QLabel;
class QenDs;
class QenDsView;

// The status bar: run state, system state, PLL, data port 1 lock, outputs, and while running
// the bit error summary, each redrawn when its state source changes.
class StateStatusBar : public QStatusBar {
  Q_OBJECT

 public:
  explicit StateStatusBar(QWidget* parent = nullptr);
  ~StateStatusBar() override;

  // Registers with the state sources of the application (after uiapp::Init).
  void Attach();
  void Detach();
  // Redraws every field from the sources.
  void ShowState();
  QString Text() const;

 private:
  class View;

  QLabel* mRun;
  QLabel* mSystem;
  QLabel* mPll;
  QLabel* mPortLock;
  QLabel* mOutputs;
  QLabel* mBer;
  std::unique_ptr<View> mView;
  std::vector<QenDs*> mSources;
};
