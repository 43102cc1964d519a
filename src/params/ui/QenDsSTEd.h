#pragma once

#include <QLineEdit>

#include "params/ui/BoundControl.h"

// A one-line text field bound to a parameter. The text is written as it stands on Return, on
// focus loss and when its window is left while it has the focus. A refused text stays for
// correcting and is not sent again on focus loss until changed. A read-only field (a parameter
// that cannot be written, as a module's model) never writes, and shows the value as a plain
// text: no frame, no edit background, a quoted string without its quotes.
class QenDsSTEd : public QLineEdit, public BoundControl {
  Q_OBJECT
  Q_PROPERTY(QString DsBaseName READ DsBaseNameProperty WRITE SetDsBaseNameProperty)
  Q_PROPERTY(QString DsCmdName READ DsCmdNameProperty WRITE SetDsCmdNameProperty)
  Q_PROPERTY(QColor BgColorFailed MEMBER mBgColorFailed)
  Q_PROPERTY(QColor FgColorFailed MEMBER mFgColorFailed)
  Q_PROPERTY(bool IsSetupConfigParameter READ IsSetupConfigParameter WRITE SetIsSetupConfigParameter)

 public:
  explicit QenDsSTEd(QWidget* parent = nullptr);

  int Refresh(ConditionList& list) override;
  int SendValue(ConditionList& list);

 protected:
  void focusOutEvent(QFocusEvent* event) override;
  void changeEvent(QEvent* event) override;

 private:
  void HitReturn();

  // The instrument refused the text shown and the user has not changed it since.
  bool mRefused = false;
};
