#pragma once

#include <QWidget>
#include <memory>

#include "core/MeasconfMeasMode.h"
#include "support/ConditionList.h"

namespace Ui {
class MeasMode;
}

// The measurement mode dialog ("measconf.MeasMode"): the mode, the gate of an error count and
// the capture settings as bound controls of the instrument-wide ":MEAS" parameters. The
// groups that do not concern the chosen mode are greyed out (still shown, so the user sees
// what the other modes would use). While open it is the editor uiapp::Run asks to send an
// edit in progress.
class MeasconfMeasModeDlg : public QWidget, public MeasconfMeasMode::Editor {
  Q_OBJECT

 public:
  explicit MeasconfMeasModeDlg(QWidget* parent = nullptr);
  ~MeasconfMeasModeDlg() override;

  int Load(ConditionList& list);
  int CommitPendingEdit(ConditionList& list) override;

 private:
  void ShowModeGroups();

  std::unique_ptr<Ui::MeasMode> mUi;
};
