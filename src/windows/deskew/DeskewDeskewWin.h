#pragma once

#include <QWidget>
#include <memory>

#include "support/ConditionList.h"

class TaskFollower;

namespace Ui {
class DeskewWin;
}

// The deskew tool ("deskew.DeskewWin"): the delay of every data port as a bound parameter
// field with its unit, and the automatic deskew (":SYST:DESK", an InstrumentTask), which the
// instrument carries out port by port with a progress bar and cancel. The fields follow the
// delays the instrument sets as it goes, through the poll like any other change.
class DeskewDeskewWin : public QWidget {
  Q_OBJECT

 public:
  explicit DeskewDeskewWin(QWidget* parent = nullptr);
  ~DeskewDeskewWin() override;

  int Load(ConditionList& list);
  TaskFollower* Follower() const { return mFollower; }
  QString StateText() const;

 private:
  int AddPortFields(ConditionList& list);

  std::unique_ptr<Ui::DeskewWin> mUi;
  TaskFollower* mFollower = nullptr;
};
