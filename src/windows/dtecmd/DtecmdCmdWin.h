#pragma once

#include <QWidget>
#include <memory>

#include "settings/CommandHistory.h"
#include "support/ConditionList.h"

class QCompleter;
class QLineEdit;
class QPlainTextEdit;

namespace Ui {
class CmdWin;
}

// The command window ("dtecmd.CmdWin"): commands of the instrument's language typed by hand,
// "::" filled in with the application handle as in the console; each command's reply and the
// errors it queued go to the transcript. Up and Down walk the history, which is kept across
// runs; Ctrl+Space completes a header from the server's list; a script of several lines runs
// line by line; the transcript can be saved.
class DtecmdCmdWin : public QWidget {
  Q_OBJECT

 public:
  explicit DtecmdCmdWin(QWidget* parent = nullptr);
  ~DtecmdCmdWin() override;

  int Load(ConditionList& list);
  // Sends one line; what happened goes to the transcript. 0, or the call's status.
  int RunLine(const QString& line);
  // Runs every non-empty line, stopping at none.
  void RunScript(const QString& script);
  int SaveTranscript(const QString& path, ConditionList& list) const;
  QString Transcript() const;
  QLineEdit* Input() const { return mInput; }
  const CommandHistory& History() const { return mHistory; }

 protected:
  bool eventFilter(QObject* watched, QEvent* event) override;

 private:
  void HitPButSend();
  void HitPButScript();
  void HitPButSaveTranscript();
  void LoadCompletion();
  void Append(const QString& text, const char* colour = nullptr);

  QPlainTextEdit* mTranscript = nullptr;
  QLineEdit* mInput = nullptr;
  QCompleter* mCompleter = nullptr;
  CommandHistory mHistory;
  std::unique_ptr<Ui::CmdWin> mUi;
};
