#include "windows/error/ErrorErrorWin.h"

#include <QApplication>
#include <QClipboard>
#include <QHeaderView>
#include <QLabel>
#include <QMdiSubWindow>
#include <QPushButton>
#include <QTreeWidget>

#include "core/ErrorJournal.h"
#include "toolkit/qt/ResourceLibrary.h"

ErrorErrorWin::ErrorErrorWin(QWidget* parent) : QWidget(parent) { setObjectName(QStringLiteral("ErrorErrorWin")); }

ErrorErrorWin::~ErrorErrorWin() { ErrorJournal::SetListener(nullptr); }

int ErrorErrorWin::Load(ConditionList& list) {
  if (int status = ResourceLibrary::LoadInto("error.ErrorWin", this, list)) return status;
  mTree = findChild<QTreeWidget*>(QStringLiteral("TreeErrors"));
  mCount = findChild<QLabel*>(QStringLiteral("LabelCount"));
  if (mTree == nullptr || mCount == nullptr) {
    list.Add(1, "The window resource \"error.ErrorWin\" lacks its list.");
    return 1;
  }
  mTree->header()->setSectionResizeMode(2, QHeaderView::Stretch);
  mTree->setColumnWidth(0, 70);
  mTree->setColumnWidth(1, 60);
  if (auto* copy = findChild<QPushButton*>(QStringLiteral("PButCopy"))) connect(copy, &QPushButton::clicked, this, &ErrorErrorWin::HitPButCopy);
  if (auto* clear = findChild<QPushButton*>(QStringLiteral("PButClear"))) connect(clear, &QPushButton::clicked, this, &ErrorErrorWin::HitPButClear);
  ErrorJournal::SetListener([this] {
    const bool grew = ErrorJournal::Entries().size() > mShown;
    ShowEntries();
    if (!grew) return;
    if (auto* sub = qobject_cast<QMdiSubWindow*>(parentWidget())) {
      sub->showNormal();
      sub->raise();
    } else {
      raise();
    }
  });
  ShowEntries();
  return 0;
}

void ErrorErrorWin::ShowEntries() {
  mTree->clear();
  QList<QTreeWidgetItem*> rows;
  for (const ErrorJournal::Entry& e : ErrorJournal::Entries()) {
    auto* row = new QTreeWidgetItem({QString::fromStdString(e.time), QString::number(e.code),
                                     QString::fromStdString(e.text), QString::fromStdString(e.command)});
    row->setToolTip(2, QString::fromStdString(e.text));
    row->setToolTip(3, QString::fromStdString(e.command));
    rows << row;
  }
  mTree->addTopLevelItems(rows);
  mShown = ErrorJournal::Entries().size();
  mCount->setText(mShown == 0 ? QStringLiteral("No errors in this session.")
                              : QStringLiteral("%1 error%2 in this session, newest first.").arg(mShown).arg(mShown == 1 ? "" : "s"));
}

QString ErrorErrorWin::RowsAsText() const {
  QList<QTreeWidgetItem*> rows = mTree->selectedItems();
  if (rows.isEmpty()) {
    for (int i = 0; i < mTree->topLevelItemCount(); ++i) rows << mTree->topLevelItem(i);
  }
  QStringList lines;
  for (const QTreeWidgetItem* row : rows) {
    lines << QStringList{row->text(0), row->text(1), row->text(2), row->text(3)}.join(QLatin1Char('\t'));
  }
  return lines.join(QLatin1Char('\n'));
}

void ErrorErrorWin::HitPButCopy() { QApplication::clipboard()->setText(RowsAsText()); }

void ErrorErrorWin::HitPButClear() { ErrorJournal::Clear(); }
