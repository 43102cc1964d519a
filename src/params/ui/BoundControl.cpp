#include "params/ui/BoundControl.h"

#include <QEvent>
#include <QPainter>
#include <QTimer>
#include <QWidget>

#include "core/uiapp.h"
#include "data/Dte.h"
#include "instrument/QenGuiInst.h"
#include "support/ErrorMgr.h"
#include "toolkit/Toolkit.h"
#include "toolkit/qt/StatusNotice.h"

namespace {

constexpr int kMarkMs = 2500;

ConditionList& PendingReport() {
  static ConditionList pending;
  return pending;
}

void ShowPendingReport(void*) {
  ConditionList list = PendingReport();
  PendingReport().Clear();
  if (!list.IsEmpty()) QenGuiInst::ShowErrorDlg(list, 1);
}

// A frame drawn over a control that lets the mouse through and follows its size.
class AdjustedMark : public QWidget {
 public:
  explicit AdjustedMark(QWidget* parent) : QWidget(parent) {
    setAttribute(Qt::WA_TransparentForMouseEvents);
    setObjectName(QStringLiteral("AdjustedMark"));
    setGeometry(parent->rect());
    parent->installEventFilter(this);
  }

 protected:
  bool eventFilter(QObject* watched, QEvent* event) override {
    if (event->type() == QEvent::Resize) setGeometry(static_cast<QWidget*>(watched)->rect());
    return false;
  }
  void paintEvent(QPaintEvent*) override {
    QPainter painter(this);
    painter.setPen(QPen(QColor(0xe0, 0x80, 0x00), 2));
    painter.drawRect(rect().adjusted(1, 1, -1, -1));
  }
};

}  // namespace

BoundControl::BoundControl(QWidget* widget, std::string_view className, bool withAttrView)
    : mWidget(widget), mColourTarget(widget), mBinding(*this, className, withAttrView) {}

BoundControl::~BoundControl() { NfyEnd(); }

void BoundControl::NfyInit() {
  if (mBinding.IsInitialised()) return;
  mNormal = mColourTarget->palette();
  mBinding.NfyInit();
  ShowSourceState();
}

void BoundControl::NfyEnd() { mBinding.NfyEnd(); }

void BoundControl::SetDsBaseNameProperty(const QString& text) {
  ConditionList list;
  SetDsBaseName(text.toStdString(), list);
  Report(list);
}

void BoundControl::SetDsCmdNameProperty(const QString& text) {
  ConditionList list;
  SetDsCmdName(text.toStdString(), list);
  Report(list);
}

int BoundControl::SetDsBaseName(const Dstring& text, ConditionList& list) {
  if (text != mBinding.GetDsBaseName()) ShowNotice({});
  return mBinding.SetDsBaseName(text, list);
}

int BoundControl::SetDsCmdName(const Dstring& text, ConditionList& list) {
  if (text != mBinding.GetDsCmdName()) ShowNotice({});
  return mBinding.SetDsCmdName(text, list);
}

void BoundControl::SetIsSetupConfigFunction(bool on) {
  mSetupFunction = on;
  mBinding.SetRegistrationFlag(mSetupFunction || mSetupParameter ? 1 : 0);
}

void BoundControl::SetIsSetupConfigParameter(bool on) {
  mSetupParameter = on;
  mBinding.SetRegistrationFlag(mSetupFunction || mSetupParameter ? 1 : 0);
}

void BoundControl::SetIsDisabled(bool disabled) {
  mDisabled = disabled;
  mWidget->setDisabled(disabled);
}

void BoundControl::SwapColours(bool failed) {
  if (failed == mShowsFailed) return;
  mShowsFailed = failed;
  QPalette palette = mNormal;
  if (failed) {
    for (auto role : {QPalette::Base, QPalette::Window, QPalette::Button}) {
      if (mBgColorFailed.isValid()) palette.setColor(role, mBgColorFailed);
    }
    for (auto role : {QPalette::Text, QPalette::WindowText, QPalette::ButtonText}) {
      if (mFgColorFailed.isValid()) palette.setColor(role, mFgColorFailed);
    }
  }
  mColourTarget->setAutoFillBackground(failed && mBgColorFailed.isValid());
  mColourTarget->setPalette(palette);
}

void BoundControl::ShowSourceState() {
  SwapColours(mBinding.IsFailed());
  ShowTip();
}

void BoundControl::ShowTip() {
  QStringList lines;
  if (!mNotice.isEmpty()) lines << mNotice;
  lines << (mAdjusted ? mAdjustedTip : QString::fromStdString(mBinding.ToolTip()));
  lines.removeAll(QString());
  mWidget->setToolTip(lines.join(QLatin1Char('\n')));
}

void BoundControl::MarkAdjusted(const QString& held, const QString& asked) {
  mAdjusted = true;
  mAdjustedTip = QStringLiteral("set to %1 (asked %2)").arg(held, asked);
  // Only the timer of the latest mark ends it.
  const unsigned generation = ++mAdjustedGeneration;
  QTimer::singleShot(kMarkMs, mWidget, [this, generation] {
    if (generation != mAdjustedGeneration) return;
    mAdjusted = false;
    ShowMark();
  });
  ShowMark();
}

void BoundControl::ShowNotice(const QString& notice) {
  mNotice = notice;
  if (!notice.isEmpty()) StatusNotice::Show(notice);
  ShowMark();
}

void BoundControl::ShowMark() {
  const bool marked = mAdjusted || !mNotice.isEmpty();
  if (marked && !mMark) {
    auto* mark = new AdjustedMark(mWidget);
    mark->show();
    mark->raise();
    mMark = mark;
  } else if (!marked && mMark) {
    mMark->deleteLater();
    mMark.clear();
  }
  ShowTip();
}

void BoundControl::Report(const ConditionList& list) {
  if (list.IsEmpty()) return;
  if (ErrorMgr* errors = uiapp::GetErrorMgr()) errors->add(list);
  const bool first = PendingReport().IsEmpty();
  PendingReport().Append(list);
  if (first) Toolkit::Get().CallDeferred(ShowPendingReport, nullptr);
}

QList<BoundControl*> BoundControl::FindAll(QWidget* root) {
  QList<BoundControl*> found;
  if (auto* self = dynamic_cast<BoundControl*>(root)) found.append(self);
  for (QWidget* child : root->findChildren<QWidget*>()) {
    if (auto* control = dynamic_cast<BoundControl*>(child)) found.append(control);
  }
  return found;
}

int BoundControl::SetDsBaseNameAll(QWidget* root, const Dstring& base, ConditionList& list,
                                   const std::function<bool(const Dstring& name)>& exists) {
  QList<BoundControl*> controls;
  for (BoundControl* control : FindAll(root)) {
    if (!exists || exists(base + control->mBinding.GetDsCmdName())) {
      controls.append(control);
    } else if (int rc = control->SetDsBaseName("", list); rc != 0) {
      return rc;
    }
  }
  // Every value the controls are about to show is read first in joined queries, so that
  // moving a panel of many controls costs a few round trips, not one or two per control.
  std::vector<QenParamDs*> held;
  if (!base.empty() && !DsBinding::IsDesignMode()) {
    for (BoundControl* control : controls) {
      const Dstring name = base + control->mBinding.GetDsCmdName();
      held.push_back(Dte::AllocDsByName(name, 0));
      if (control->mBinding.HasAttrView()) held.push_back(Dte::AllocDsByName(name + ":ATTR", 0));
    }
    Dte::Prefetch(held);
  }
  int status = 0;
  for (BoundControl* control : controls) {
    if (int rc = control->SetDsBaseName(base, list); rc != 0 && status == 0) status = rc;
  }
  for (QenParamDs* source : held) Dte::FreeDs(source);
  return status;
}
