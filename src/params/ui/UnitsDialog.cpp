#include "params/ui/UnitsDialog.h"

#include <QLabel>
#include <QPushButton>
#include <QRadioButton>

#include "params/UnitsDialogTable.h"
#include "toolkit/qt/HelpKey.h"
#include "toolkit/qt/HelpWindow.h"
#include "toolkit/qt/ResourceLibrary.h"

namespace {

// Both names of the dialog show the one page of the guide.
constexpr const char* kHelpPage = "unitsdlg.UnitsDialog";

template <class T>
T* Child(const QWidget* dialog, const char* name) {
  return dialog->findChild<T*>(QString::fromLatin1(name));
}

}  // namespace

UnitsDialog::UnitsDialog(const char* library, QWidget* parent) : QDialog(parent) {
  HelpKey::SetPage(this, kHelpPage);
  mLoaded = ResourceLibrary::LoadInto(Dstring(library) + ".UnitsDialog", this, mLoadErrors) == 0;
  if (!mLoaded) return;
  if (auto* ok = Child<QPushButton>(this, "PButOK")) {
    ok->setDefault(true);
    connect(ok, &QPushButton::clicked, this, &QDialog::accept);
  }
  if (auto* cancel = Child<QPushButton>(this, "PButCancel")) connect(cancel, &QPushButton::clicked, this, &QDialog::reject);
  if (auto* help = Child<QPushButton>(this, "PButHelp")) connect(help, &QPushButton::clicked, this, &UnitsDialog::HitPButHelp);
}

unsigned UnitsDialog::LoadProcess(UnitsRecord* units, ConditionList& list) {
  if (!mLoaded) {
    list.Append(mLoadErrors);
    return 1;
  }
  NfyInit(*units);
  if (exec() != QDialog::Accepted) return 1;
  TakeChoice(*units);
  return 0;
}

void UnitsDialog::NfyInit(const UnitsRecord& units) {
  if (auto* label = Child<QLabel>(this, "TAreaUnitsLabel")) {
    label->setText(QStringLiteral("Unit of %1").arg(QString::fromStdString(units.unitName)));
  }
  for (const auto& button : UnitsDialogTable::PrefixButtons()) {
    auto* radio = Child<QRadioButton>(this, button.name);
    if (radio == nullptr) continue;
    const bool allowed = button.exp >= units.minExp && button.exp <= units.maxExp;
    radio->setVisible(allowed);
    if (!allowed) continue;
    radio->setText(QString::fromStdString(UnitsRecord::PrefixOf(button.exp) + units.unitName));
    if (button.exp == units.curExp) radio->setChecked(true);
  }
  const auto& steps = UnitsDialogTable::StepButtons();
  if (auto* radio = Child<QRadioButton>(this, steps[static_cast<std::size_t>(UnitsDialogTable::StepButtonIndex(units.step))].name)) {
    radio->setChecked(true);
  }
}

void UnitsDialog::TakeChoice(UnitsRecord& units) const {
  for (const auto& button : UnitsDialogTable::PrefixButtons()) {
    auto* radio = Child<QRadioButton>(this, button.name);
    if (radio != nullptr && radio->isVisibleTo(this) && radio->isChecked()) units.curExp = button.exp;
  }
  for (const auto& button : UnitsDialogTable::StepButtons()) {
    auto* radio = Child<QRadioButton>(this, button.name);
    if (radio != nullptr && radio->isChecked()) units.step = button.step;
  }
}

void UnitsDialog::HitPButHelp() {
  HelpWindow::Show(kHelpPage, this);
}
