#pragma once

#include <QSlider>

#include "params/ui/BoundControl.h"

// A slider bound to a numeric parameter: position = value × the denominator of its main
// scale. A position the user proposes is written, read back, and the thumb snaps to what the
// instrument took. Tracking is off, so a drag proposes once, on release; the wheel moves it
// only while it has the focus.
class QenDsSlidr : public QSlider, public BoundControl {
  Q_OBJECT
  Q_PROPERTY(QString DsBaseName READ DsBaseNameProperty WRITE SetDsBaseNameProperty)
  Q_PROPERTY(QString DsCmdName READ DsCmdNameProperty WRITE SetDsCmdNameProperty)
  Q_PROPERTY(QColor ColorFailed MEMBER mColorFailed)
  Q_PROPERTY(QColor ColorClashing MEMBER mColorClashing)
  Q_PROPERTY(double Denominator1 MEMBER mDenominator1)
  Q_PROPERTY(double Denominator2 MEMBER mDenominator2)
  Q_PROPERTY(int MainScale MEMBER mMainScale)

 public:
  explicit QenDsSlidr(QWidget* parent = nullptr);

  void NfyInit() override;
  int Refresh(ConditionList& list) override;
  // The user proposes a position (blocker scope "QenDsSlidr::NfyPropose").
  int NfyPropose(int position, ConditionList& list);
  double Denominator() const { return mMainScale == 0 ? mDenominator1 : mDenominator2; }

  QColor mColorFailed;
  QColor mColorClashing;
  double mDenominator1 = 1.0;
  double mDenominator2 = 1.0;
  int mMainScale = 0;

 protected:
  void wheelEvent(QWheelEvent* event) override;

 private:
  void ShowPosition(double value);
  void ShowThumbColour();
  void HitValue(int position);

  QPalette mThumbNormal;
  bool mUpdating = false;
};
