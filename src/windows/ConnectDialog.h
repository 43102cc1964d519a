#pragma once

#include <QDialog>

#include "support/DstringList.h"

class QLineEdit;
class QListWidget;

// Asks which instrument server to use: the built-in simulator, a server found on the hosts
// worth asking (loopback first, then QEN_SERVER_HOSTS and the last address used), or an
// address typed as HOST:PORT. The last address is remembered in the registry profile.
class ConnectDialog : public QDialog {
  Q_OBJECT

 public:
  static constexpr unsigned short kDefaultPort = 7130;
  static constexpr unsigned long kProbeMs = 300;

  explicit ConnectDialog(QWidget* parent = nullptr);

  // Probes the candidate hosts and lists the servers that answer.
  void Search();
  bool UseSimulator() const { return mSimulator; }
  const Dstring& Host() const { return mHost; }
  unsigned short Port() const { return mPort; }
  // The address remembered from the last session, empty when none.
  static Dstring LastAddress();
  static void RememberAddress(const Dstring& address);
  QListWidget* Servers() const { return mList; }
  QLineEdit* AddressField() const { return mAddress; }

 private:
  void HitPButConnect();
  void NfyServerChosen();

  QListWidget* mList;
  QLineEdit* mAddress;
  bool mSimulator = true;
  Dstring mHost;
  unsigned short mPort = kDefaultPort;
};
