#include "windows/ConnectDialog.h"

#include <QDialogButtonBox>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QMessageBox>
#include <QPushButton>
#include <QVBoxLayout>

#include "instrument/QenGuiInst.h"
#include "settings/QENRegistryProfile.h"
#include "settings/RegistryStore.h"
#include "toolkit/WaitCursor.h"
#include "toolkit/qt/HelpKey.h"

namespace {

constexpr const char* kValueName = "LastAddress";
const QString kSimulator = QStringLiteral("Built-in simulator (qensim)");

Dstring Key() { return Dstring(QENRegistryProfile::kGuiKey) + "\\Connection"; }

// HOST:PORT, or HOST alone with the default port.
bool SplitAddress(const QString& text, Dstring& host, unsigned short& port) {
  const QString trimmed = text.trimmed();
  const int colon = trimmed.lastIndexOf(QLatin1Char(':'));
  bool ok = true;
  const unsigned value = colon < 0 ? ConnectDialog::kDefaultPort : trimmed.mid(colon + 1).toUInt(&ok);
  host = (colon < 0 ? trimmed : trimmed.left(colon)).toStdString();
  if (!ok || value == 0 || value > 65535 || host.empty()) return false;
  port = static_cast<unsigned short>(value);
  return true;
}

}  // namespace

ConnectDialog::ConnectDialog(QWidget* parent) : QDialog(parent), mList(new QListWidget), mAddress(new QLineEdit) {
  setObjectName(QStringLiteral("ConnectDialog"));
  HelpKey::SetPage(this, "ConnectDialog");
  setWindowTitle(QStringLiteral("Connect to an Instrument"));
  auto* layout = new QVBoxLayout(this);
  layout->addWidget(new QLabel(QStringLiteral("Instrument servers found:")));
  mList->setObjectName(QStringLiteral("ListServers"));
  layout->addWidget(mList);
  layout->addWidget(new QLabel(QStringLiteral("Or the address of a server (HOST:PORT):")));
  mAddress->setObjectName(QStringLiteral("EditAddress"));
  mAddress->setPlaceholderText(QStringLiteral("lab-pg1:7130"));
  mAddress->setText(QString::fromStdString(LastAddress()));
  layout->addWidget(mAddress);
  auto* buttons = new QDialogButtonBox;
  QPushButton* connectButton = buttons->addButton(QStringLiteral("&Connect"), QDialogButtonBox::AcceptRole);
  connectButton->setObjectName(QStringLiteral("PButConnect"));
  buttons->addButton(QStringLiteral("&Search Again"), QDialogButtonBox::ActionRole)->setObjectName(QStringLiteral("PButSearch"));
  buttons->addButton(QDialogButtonBox::Cancel);
  connect(buttons, &QDialogButtonBox::clicked, this, [this, buttons](QAbstractButton* b) {
    if (buttons->buttonRole(b) == QDialogButtonBox::ActionRole) Search();
  });
  connect(connectButton, &QPushButton::clicked, this, &ConnectDialog::HitPButConnect);
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  connect(mList, &QListWidget::itemSelectionChanged, this, &ConnectDialog::NfyServerChosen);
  connect(mList, &QListWidget::itemDoubleClicked, this, &ConnectDialog::HitPButConnect);
  layout->addWidget(buttons);
  resize(420, 320);
}

void ConnectDialog::Search() {
  WaitCursor wait;
  mList->clear();
  mList->addItem(kSimulator);
  DstringList remembered;
  Dstring host;
  unsigned short port = kDefaultPort;
  if (SplitAddress(QString::fromStdString(LastAddress()), host, port)) remembered.push_back(host);
  DstringList found;
  QenGuiInst::ListServerHostsAtPort(found, kDefaultPort, kProbeMs, QenGuiInst::CandidateHosts(remembered));
  for (const Dstring& h : found) mList->addItem(QStringLiteral("%1:%2").arg(QString::fromStdString(h)).arg(kDefaultPort));
  mList->setCurrentRow(0);
}

void ConnectDialog::NfyServerChosen() {
  const QListWidgetItem* item = mList->currentItem();
  if (item != nullptr && item->text() != kSimulator) mAddress->setText(item->text());
  if (item != nullptr && item->text() == kSimulator) mAddress->clear();
}

void ConnectDialog::HitPButConnect() {
  const QListWidgetItem* item = mList->currentItem();
  mSimulator = mAddress->text().trimmed().isEmpty() && (item == nullptr || item->text() == kSimulator);
  if (!mSimulator && !SplitAddress(mAddress->text(), mHost, mPort)) {
    QMessageBox::warning(this, windowTitle(), QStringLiteral("\"%1\" is not an address of the form HOST:PORT.").arg(mAddress->text()));
    return;
  }
  if (!mSimulator) RememberAddress(Dstring::Format("%s:%u", mHost.c_str(), mPort));
  accept();
}

Dstring ConnectDialog::LastAddress() {
  Dstring address;
  ConditionList ignored;
  int exists = 0;
  void* root = RegistryStore::CurrentUser();
  if (QENRegistryProfile::Exists(root, Key(), kValueName, exists, ignored) == 0 && exists) {
    QENRegistryProfile::GetValue(root, Key(), kValueName, address, ignored);
  }
  return address;
}

void ConnectDialog::RememberAddress(const Dstring& address) {
  ConditionList ignored;
  QENRegistryProfile::SetValue(RegistryStore::CurrentUser(), Key(), kValueName, address, ignored);
}
