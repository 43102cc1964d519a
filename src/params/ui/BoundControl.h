#pragma once

#include <QColor>
#include <QList>
#include <QPalette>
#include <QPointer>
#include <functional>
#include <string_view>

#include "params/DsBinding.h"
#include "toolkit/qt/ResourceWidget.h"

class QWidget;

// The Qt side of the binding that every data-bound control holds: the control's widget, its
// failed colours swapped in and out against the normal ones saved at init, its tooltip, the
// marks of a value the instrument took differently and of text a commit left out, and the
// reporting of errors from the user's own actions.
class BoundControl : public DsBinding::Client, public ResourceWidget {
 public:
  BoundControl(QWidget* widget, std::string_view className, bool withAttrView = false);
  ~BoundControl() override;
  BoundControl(const BoundControl&) = delete;
  BoundControl& operator=(const BoundControl&) = delete;

  DsBinding& Binding() { return mBinding; }
  const DsBinding& Binding() const { return mBinding; }
  // Saves the normal colours and registers; later calls do nothing.
  void NfyInit() override;
  void NfyEnd();
  bool IsInitialised() const { return mBinding.IsInitialised(); }

  // The attributes as properties: a change from a form or a script moves the registration,
  // and what goes wrong is reported like a user's action.
  QString DsBaseNameProperty() const { return QString::fromStdString(mBinding.GetDsBaseName()); }
  QString DsCmdNameProperty() const { return QString::fromStdString(mBinding.GetDsCmdName()); }
  void SetDsBaseNameProperty(const QString& text);
  void SetDsCmdNameProperty(const QString& text);
  // A notice about the old name does not stay on the new one.
  int SetDsBaseName(const Dstring& text, ConditionList& list);
  int SetDsCmdName(const Dstring& text, ConditionList& list);
  Dstring GetDsName() const { return mBinding.GetDsName(); }

  QColor mBgColorFailed;
  QColor mFgColorFailed;

  // The flags of the attributes "IsSetupConfigFunction" (read and write through the
  // sub-command form) and "IsSetupConfigParameter"; registration passes either.
  bool IsSetupConfigFunction() const { return mSetupFunction; }
  bool IsSetupConfigParameter() const { return mSetupParameter; }
  void SetIsSetupConfigFunction(bool on);
  void SetIsSetupConfigParameter(bool on);
  // "IsDisabled": the widget is disabled while set.
  bool IsDisabled() const { return mDisabled; }
  void SetIsDisabled(bool disabled);

  // Failed colours while the source is failed, and the tooltip.
  void ShowSourceState();
  // Marks the control for a moment: the instrument holds `held`, the user asked for `asked`.
  void MarkAdjusted(const QString& held, const QString& asked);
  bool IsMarkedAdjusted() const { return mAdjusted; }
  // Marks the control with what a commit made of the user's text, in the tooltip and on the
  // status bar, until the next commit or a move to another parameter; empty clears it.
  void ShowNotice(const QString& notice);
  const QString& Notice() const { return mNotice; }

  // Conditions of a user's action: kept in the error manager and shown after the event.
  static void Report(const ConditionList& list);
  // Every bound control in `root` (and root itself).
  static QList<BoundControl*> FindAll(QWidget* root);
  // Moves every bound control in `root` to the base name `base`; with `exists`, a control whose
  // new name it refuses is unbound instead (the item has no such parameter).
  static int SetDsBaseNameAll(QWidget* root, const Dstring& base, ConditionList& list,
                              const std::function<bool(const Dstring& name)>& exists = {});

 protected:
  // The widget whose palette shows the failed colours (the inner editor of a compound).
  void SetColourTarget(QWidget* target) { mColourTarget = target; }
  QWidget* Widget() const { return mWidget; }

 private:
  void SwapColours(bool failed);
  // The frame while marked, and the tooltip.
  void ShowMark();
  void ShowTip();

  QWidget* mWidget;
  QWidget* mColourTarget;
  DsBinding mBinding;
  QPalette mNormal;
  bool mShowsFailed = false;
  bool mSetupFunction = false;
  bool mSetupParameter = false;
  bool mDisabled = false;
  QPointer<QWidget> mMark;
  bool mAdjusted = false;
  unsigned mAdjustedGeneration = 0;
  QString mAdjustedTip;
  QString mNotice;
};
