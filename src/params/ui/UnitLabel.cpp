#include "params/ui/UnitLabel.h"

#include <QContextMenuEvent>
#include <QMenu>
#include <QMouseEvent>

#include "data/QenParamDs.h"
#include "instrument/QenStatus.h"
#include "params/UnitMenu.h"
#include "params/ui/QenParField.h"
#include "support/FWBlocker.h"

UnitLabel::UnitLabel() {
  setObjectName(QStringLiteral("UnitLabel"));
  setMinimumWidth(fontMetrics().horizontalAdvance(QStringLiteral("MHz")) + 6);
  setToolTip(QStringLiteral("Click for the units dialog; right-click for prefix and step"));
}

const UnitsRecord& UnitLabel::Units() const {
  static const UnitsRecord kNone;
  return mField != nullptr ? mField->State().GetUnits() : kNone;
}

void UnitLabel::NfyInit() { setText(QString::fromStdString(Units().unitName)); }

int UnitLabel::Refresh(ConditionList& list) {
  FWBlocker blocker("UnitEd::Refresh", list);
  if (int blocked = blocker.Block()) return blocked;
  if (DsBinding::IsDesignMode() || mField == nullptr || mField->GetDsName().empty()) return 0;
  if (int status = mField->State().ReadUnits(mField->Binding(), list)) return status;
  setText(QString::fromStdString(Units().LabelText()));
  mField->DisplayValue(mField->State().GetValue());
  return 0;
}

int UnitLabel::SendUnits(const UnitsRecord& units, ConditionList& list) {
  if (DsBinding::IsDesignMode() || mField == nullptr) return 0;
  QenParamDs* attr = mField->Binding().GetAttrDs();
  if (attr == nullptr) return 0;
  ConditionList sent;
  const int status = attr->SetStrValue(units.Format(), sent);
  if (status == QenStatus::kLocked) return 0;
  list.Append(sent);
  return status;
}

void UnitLabel::NfyItemHit(int item) {
  if (item != UnitMenu::kUnitsDialog || mField == nullptr) return;
  ConditionList list;
  FWBlocker blocker("UnitEd::NfyItemHit", list);
  if (blocker.Block() != 0) return;
  UnitsRecord copy = Units();
  const unsigned result = ProcessUnitsDialog(copy, list);
  if (result == 0 && copy != Units()) SendUnits(copy, list);
  BoundControl::Report(list);
}

void UnitLabel::NfyPopupMenuItemSelect(int id) {
  if (id == UnitMenu::kUnitsDialog) return NfyItemHit(id);
  UnitsRecord copy = Units();
  if (!UnitMenu::Apply(id, copy) || copy == Units()) return;
  ConditionList list;
  SendUnits(copy, list);
  BoundControl::Report(list);
}

QMenu* UnitLabel::BuildPopupMenu(QWidget* parent) {
  const UnitsRecord& units = Units();
  auto* menu = new QMenu(parent);
  QMenu* prefixes = menu->addMenu(QStringLiteral("&Prefix"));
  for (int i = 0; UnitMenu::kPrefixLetters[i] != '\0'; ++i) {
    const int id = UnitMenu::PrefixItemId(i);
    QAction* action = prefixes->addAction(QString::fromStdString(UnitMenu::PrefixItemLabel(i, units)));
    action->setData(id);
    action->setCheckable(true);
    action->setChecked(id == units.curExp + UnitMenu::kPrefixMenu);
    action->setVisible(UnitMenu::IsPrefixItemVisible(id, units));
  }
  QMenu* steps = menu->addMenu(QStringLiteral("&Step"));
  const int checkedStep = UnitMenu::CheckedStepItemId(units.step);
  for (int exp = UnitMenu::kFirstStepExp; exp >= UnitMenu::kLastStepExp; --exp) {
    const int id = UnitMenu::kStepMenu + exp;
    QAction* action = steps->addAction(QString::fromStdString(UnitMenu::StepItemLabel(id)));
    action->setData(id);
    action->setCheckable(true);
    action->setChecked(id == checkedStep);
  }
  menu->addSeparator();
  menu->addAction(QStringLiteral("&Units..."))->setData(UnitMenu::kUnitsDialog);
  connect(menu, &QMenu::triggered, this, [this](QAction* action) { NfyPopupMenuItemSelect(action->data().toInt()); });
  return menu;
}

void UnitLabel::SetHighlighted(bool on) {
  mHighlighted = on;
  setAutoFillBackground(on);
  setBackgroundRole(on ? QPalette::Highlight : QPalette::Window);
  setForegroundRole(on ? QPalette::HighlightedText : QPalette::WindowText);
}

void UnitLabel::mousePressEvent(QMouseEvent* event) {
  if (event->button() != Qt::LeftButton || mField == nullptr || mField->GetDsName().empty()) {
    return QLabel::mousePressEvent(event);
  }
  if (mField->IsEnabled()) mField->setFocus(Qt::MouseFocusReason);
  ConditionList ignored;
  FWBlocker blocker("UnitEd::NfyMouseClick", ignored);
  if (blocker.Block() != 0) return;
  mTracking = true;
  SetHighlighted(true);
}

void UnitLabel::mouseMoveEvent(QMouseEvent* event) {
  if (mTracking) SetHighlighted(rect().contains(event->position().toPoint()));
}

void UnitLabel::mouseReleaseEvent(QMouseEvent* event) {
  if (!mTracking) return QLabel::mouseReleaseEvent(event);
  mTracking = false;
  SetHighlighted(false);
  if (rect().contains(event->position().toPoint())) NfyItemHit(mItemNumber);
}

void UnitLabel::contextMenuEvent(QContextMenuEvent* event) { ShowPopupMenu(event->globalPos()); }

void UnitLabel::ShowPopupMenu(const QPoint& global) {
  if (mField == nullptr || mField->GetDsName().empty()) return;
  QMenu* menu = BuildPopupMenu(this);
  menu->setAttribute(Qt::WA_DeleteOnClose);
  menu->popup(global);
}
