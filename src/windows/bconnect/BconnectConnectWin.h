#pragma once

#include <QWidget>
#include <memory>

#include "sequences/CPortConnections.h"
#include "support/ConditionList.h"

class QLabel;
class QenDs;
class SchemeView;

namespace Ui {
class BconnectConnectWin;
}

// The system scheme window ("bconnect.ConnectWin"): the rack from the port and front-end
// information with the connections the instrument holds, which the user draws and removes in
// the scheme. Every change is sent at once and the scheme then shows what the server holds, so a
// refused connection leaves it as it was and the state line gives the server's reason. Another
// client's change arrives through the dirty flag within the poll. While another client holds the
// instrument the scheme is read-only and says so. The scheme is exported as PNG or SVG.
class BconnectConnectWin : public QWidget {
  Q_OBJECT

 public:
  explicit BconnectConnectWin(QWidget* parent = nullptr);
  ~BconnectConnectWin() override;

  int Load(ConditionList& list);
  // Reads the rack and the connections and draws them.
  int Refresh(ConditionList& list);
  int Connect(const Dstring& generator, const Dstring& analyser, ConditionList& list);
  int Disconnect(const Dstring& generator, const Dstring& analyser, ConditionList& list);
  int ExportPng(const Dstring& path, ConditionList& list);
  int ExportSvg(const Dstring& path, ConditionList& list);

  SchemeView* View() const { return mView; }
  const CPortConnections& Connections() const { return mConnections; }
  QString StateText() const;
  QString SummaryText() const;

 private:
  class LockView;

  static int DirtyFlagProc(QenDs* source, void* client, ConditionList& list);
  static int DirtyFlagMatch(QenDs* source, void* client, const Dstring& name);
  // Sends an edit under its guard and draws what the server holds afterwards.
  template <class Edit>
  int RunEdit(const char* guard, const QString& done, Edit edit, ConditionList& list);
  void Draw();
  void ShowLock();
  // What the user can do now: the selected connection, else how to draw one, or the lock.
  void ShowSelection();
  void Say(const QString& text);
  void HitPButExport(bool svg);

  SchemeView* mView = nullptr;
  QLabel* mState = nullptr;
  QLabel* mSummary = nullptr;
  CPortConnections mConnections;
  bool mRegistered = false;
  std::unique_ptr<LockView> mLockView;
  std::unique_ptr<Ui::BconnectConnectWin> mUi;
};
