#include "windows/dtecmd/DtecmdCmdWin.h"

#include <QAbstractItemView>
#include <QCompleter>
#include <QFile>
#include <QFileDialog>
#include <QFontDatabase>
#include <QInputDialog>
#include <QKeyEvent>
#include <QLineEdit>
#include <QPlainTextEdit>
#include <QPushButton>
#include <QStringListModel>

#include "core/ErrorJournal.h"
#include "instrument/CommandText.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "params/ui/BoundControl.h"
#include "support/DataParcel.h"
#include "support/ParserExpression.h"
#include "toolkit/WaitCursor.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "ui_dtecmd.CmdWin.h"

DtecmdCmdWin::DtecmdCmdWin(QWidget* parent) : QWidget(parent), mUi(std::make_unique<Ui::CmdWin>()) { setObjectName(QStringLiteral("DtecmdCmdWin")); }

DtecmdCmdWin::~DtecmdCmdWin() {
  ConditionList ignored;
  mHistory.Write(ignored);
}

int DtecmdCmdWin::Load(ConditionList&) {
  mUi->setupUi(this);
  ResourceLibrary::InitWidgets(this);
  mTranscript = mUi->TextTranscript;
  mInput = mUi->EditCommand;
  mTranscript->setFont(QFontDatabase::systemFont(QFontDatabase::FixedFont));
  mInput->setFont(QFontDatabase::systemFont(QFontDatabase::FixedFont));
  mInput->installEventFilter(this);
  connect(mInput, &QLineEdit::returnPressed, this, &DtecmdCmdWin::HitPButSend);
  connect(mUi->PButSend, &QPushButton::clicked, this, &DtecmdCmdWin::HitPButSend);
  connect(mUi->PButScript, &QPushButton::clicked, this, &DtecmdCmdWin::HitPButScript);
  connect(mUi->PButSaveTranscript, &QPushButton::clicked, this, &DtecmdCmdWin::HitPButSaveTranscript);
  connect(mUi->PButClear, &QPushButton::clicked, mTranscript, &QPlainTextEdit::clear);
  ConditionList ignored;
  mHistory.Read(ignored);
  LoadCompletion();
  setFocusProxy(mInput);
  return 0;
}

// The server's parameter headers, written as the user types them ("::CGR1:FREQ").
void DtecmdCmdWin::LoadCompletion() {
  const Dstring handle = QenGuiInst::GetAppHandle();
  Dstring reply;
  ConditionList ignored;
  QStringList headers;
  DataParcel items;
  if (QenGuiInst::Call(":L:" + handle + "?", reply, ignored) == 0 && ParserExpression::Parse(reply, items, ignored) == 0) {
    const Dstring prefix = ":" + handle;
    for (const DataItem& item : items) {
      Dstring header(item.GetText());
      if (header.rfind(prefix, 0) == 0) headers << QStringLiteral(":") + QString::fromStdString(header.substr(prefix.size()));
    }
  }
  mCompleter = new QCompleter(headers, this);
  mCompleter->setCaseSensitivity(Qt::CaseInsensitive);
  mCompleter->setCompletionMode(QCompleter::PopupCompletion);
  mCompleter->setWidget(mInput);
  connect(mCompleter, qOverload<const QString&>(&QCompleter::activated), this, [this](const QString& header) {
    // Only the command being typed, after the last ";", is completed.
    const QString text = mInput->text();
    const int split = text.lastIndexOf(QLatin1Char(';'));
    mInput->setText(split < 0 ? header : text.left(split + 1) + header);
  });
}

void DtecmdCmdWin::Append(const QString& text, const char* colour) {
  if (colour == nullptr) {
    mTranscript->appendPlainText(text);
  } else {
    mTranscript->appendHtml(QStringLiteral("<span style=\"color:%1\">%2</span>").arg(QLatin1String(colour), text.toHtmlEscaped()));
  }
}

int DtecmdCmdWin::RunLine(const QString& line) {
  const Dstring text = line.trimmed().toStdString();
  if (text.empty()) return 0;
  mHistory.Add(text);
  Append(QStringLiteral("> ") + line.trimmed(), "#0b4f9c");
  ConditionList list;
  if (int status = CommandText::CheckLine(text, list)) {
    for (const Condition& c : list) {
      Append(QStringLiteral("refused: %1").arg(QString::fromStdString(c.GetMessage())), "#b00020");
      ErrorJournal::Add(text, c);
    }
    return status;
  }
  Dstring reply;
  int status = 0;
  {
    WaitCursor wait;
    status = QenGuiInst::Call(CommandText::ExpandHandle(text, QenGuiInst::GetAppHandle()), reply, list);
  }
  if (!reply.empty()) Append(QString::fromStdString(reply));
  if (status == QenStatus::kLocked) Append(QStringLiteral("(not sent: another client holds the instrument)"), "#8a6d00");
  for (const Condition& c : list) {
    Append(QStringLiteral("error %1: %2").arg(c.GetCode()).arg(QString::fromStdString(c.GetMessage())), "#b00020");
  }
  return status;
}

void DtecmdCmdWin::RunScript(const QString& script) {
  for (const QString& line : script.split(QLatin1Char('\n'))) {
    if (!line.trimmed().isEmpty()) RunLine(line);
  }
}

QString DtecmdCmdWin::Transcript() const { return mTranscript->toPlainText(); }

int DtecmdCmdWin::SaveTranscript(const QString& path, ConditionList& list) const {
  QFile file(path);
  if (!file.open(QIODevice::WriteOnly | QIODevice::Truncate | QIODevice::Text) ||
      file.write(Transcript().toUtf8() + '\n') < 0 || !file.flush()) {
    list.Add(1, "The transcript could not be written to " + path.toStdString() + ": " + file.errorString().toStdString());
    return 1;
  }
  return 0;
}

void DtecmdCmdWin::HitPButSend() {
  const QString line = mInput->text();
  mInput->clear();
  RunLine(line);
}

void DtecmdCmdWin::HitPButScript() {
  bool ok = false;
  const QString script = QInputDialog::getMultiLineText(this, QStringLiteral("Run Script"),
                                                        QStringLiteral("One command per line:"), QString(), &ok);
  if (ok) RunScript(script);
}

void DtecmdCmdWin::HitPButSaveTranscript() {
  const QString path = QFileDialog::getSaveFileName(this, QStringLiteral("Save Transcript"), QStringLiteral("transcript.txt"),
                                                    QStringLiteral("Text (*.txt);;All files (*)"));
  if (path.isEmpty()) return;
  ConditionList list;
  SaveTranscript(path, list);
  BoundControl::Report(list);
}

bool DtecmdCmdWin::eventFilter(QObject* watched, QEvent* event) {
  if (watched != mInput || event->type() != QEvent::KeyPress) return QWidget::eventFilter(watched, event);
  auto* key = static_cast<QKeyEvent*>(event);
  if (mCompleter != nullptr && mCompleter->popup()->isVisible()) return false;
  if (key->key() == Qt::Key_Up) {
    mInput->setText(QString::fromStdString(mHistory.Previous(mInput->text().toStdString())));
    return true;
  }
  if (key->key() == Qt::Key_Down) {
    mInput->setText(QString::fromStdString(mHistory.Next()));
    return true;
  }
  if (key->key() == Qt::Key_Space && (key->modifiers() & Qt::ControlModifier)) {
    QString word = mInput->text().section(QLatin1Char(';'), -1).trimmed();
    mCompleter->setCompletionPrefix(word.section(QLatin1Char(' '), 0, 0));
    mCompleter->complete();
    return true;
  }
  return false;
}
