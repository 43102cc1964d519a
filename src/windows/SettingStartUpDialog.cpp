#include "windows/SettingStartUpDialog.h"

#include <QCheckBox>
#include <QComboBox>
#include <QDialogButtonBox>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QRadioButton>
#include <QVBoxLayout>

#include "settings/StartUpConfig.h"
#include "toolkit/qt/HelpKey.h"

SettingStartUpDialog::SettingStartUpDialog(QWidget* parent)
    : QDialog(parent),
      mKeep(new QRadioButton(QStringLiteral("&Keep what the instrument holds"))),
      mNew(new QRadioButton(QStringLiteral("Start a &new setting (every parameter back at its default)"))),
      mLoad(new QRadioButton(QStringLiteral("&Load a setting the instrument keeps:"))),
      mName(new QComboBox),
      mCableDelay(new QCheckBox(QStringLiteral("Take the &cable delays stored in the setting"))),
      mShowDialog(new QCheckBox(QStringLiteral("&Ask at every start"))),
      mProblem(new QLabel) {
  setObjectName(QStringLiteral("SettingStartUpDialog"));
  HelpKey::SetPage(this, "SettingStartUpDialog");
  setWindowTitle(QStringLiteral("Start"));
  auto* layout = new QVBoxLayout(this);
  layout->addWidget(new QLabel(QStringLiteral("What should the instrument hold when the interface starts?")));
  layout->addWidget(mKeep);
  layout->addWidget(mNew);
  layout->addWidget(mLoad);
  mName->setEditable(true);
  mName->setInsertPolicy(QComboBox::NoInsert);
  mName->setMinimumWidth(260);
  auto* indented = new QVBoxLayout;
  indented->setContentsMargins(24, 0, 0, 0);
  indented->addWidget(mName);
  indented->addWidget(mCableDelay);
  layout->addLayout(indented);
  layout->addSpacing(8);
  layout->addWidget(mShowDialog);
  auto* note = new QLabel(QStringLiteral("The choice is kept for the next start; hold Shift while starting to see it again."));
  note->setWordWrap(true);
  note->setStyleSheet(QStringLiteral("color: #555"));
  layout->addWidget(note);
  mProblem->setObjectName(QStringLiteral("StartUpProblem"));
  mProblem->setWordWrap(true);
  mProblem->setStyleSheet(QStringLiteral("color: #a00000"));
  mProblem->hide();
  layout->addWidget(mProblem);
  auto* buttons = new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Cancel);
  buttons->button(QDialogButtonBox::Ok)->setText(QStringLiteral("&Start"));
  layout->addWidget(buttons);
  connect(buttons, &QDialogButtonBox::accepted, this, &QDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  for (QRadioButton* choice : {mKeep, mNew, mLoad}) {
    connect(choice, &QRadioButton::toggled, this, &SettingStartUpDialog::NfyChoiceChanged);
  }
}

bool SettingStartUpDialog::Ask(StartUpConfig& config, const DstringList& names, const ConditionList& problems) {
  Fill(config, names, problems);
  if (exec() != QDialog::Accepted) return false;
  Take(config);
  return true;
}

void SettingStartUpDialog::Fill(const StartUpConfig& config, const DstringList& names, const ConditionList& problems) {
  mName->clear();
  for (const Dstring& name : names) mName->addItem(QString::fromStdString(name));
  const QString name = QString::fromStdString(config.GetSettingName());
  const int index = mName->findText(name);
  if (index >= 0) {
    mName->setCurrentIndex(index);
  } else if (config.GetStart() == StartUpConfig::Start::kLoadSetting) {
    // A configured name the instrument does not keep stays visible, so the problem line makes sense.
    mName->setEditText(name);
  }
  using Start = StartUpConfig::Start;
  mKeep->setChecked(config.GetStart() == Start::kKeepSetting);
  mNew->setChecked(config.GetStart() == Start::kNewSetting);
  mLoad->setChecked(config.GetStart() == Start::kLoadSetting);
  mCableDelay->setChecked(config.GetCableDelay());
  mShowDialog->setChecked(config.GetShowDialog());
  QStringList lines;
  for (const Condition& problem : problems) lines << QString::fromStdString(problem.GetMessage());
  mProblem->setText(lines.join(QLatin1Char('\n')));
  mProblem->setVisible(!lines.isEmpty());
  NfyChoiceChanged();
}

void SettingStartUpDialog::Take(StartUpConfig& config) const {
  using Start = StartUpConfig::Start;
  config.SetStart(mLoad->isChecked() ? Start::kLoadSetting : mNew->isChecked() ? Start::kNewSetting : Start::kKeepSetting);
  if (mLoad->isChecked()) config.SetSettingName(mName->currentText().trimmed().toStdString());
  config.SetCableDelay(mCableDelay->isChecked());
  config.SetShowDialog(mShowDialog->isChecked());
}

void SettingStartUpDialog::NfyChoiceChanged() {
  mName->setEnabled(mLoad->isChecked());
  mCableDelay->setEnabled(mLoad->isChecked());
}
