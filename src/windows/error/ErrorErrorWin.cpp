#include "windows/error/ErrorErrorWin.h"

#include <QApplication>
#include <QClipboard>
#include <QHeaderView>
#include <QLabel>
#include <QMdiSubWindow>
#include <QPushButton>
#include <QTableView>

#include "core/ErrorJournal.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "ui_error.ErrorWin.h"
#include "windows/error/ErrorJournalModel.h"

ErrorErrorWin::ErrorErrorWin(QWidget* parent) : QWidget(parent), mUi(std::make_unique<Ui::ErrorWin>()) {
  setObjectName(QStringLiteral("ErrorErrorWin"));
}

ErrorErrorWin::~ErrorErrorWin() = default;

int ErrorErrorWin::Load(ConditionList&) {
  mUi->setupUi(this);
  ResourceLibrary::InitWidgets(this);
  mTable = mUi->TableErrors;
  mCount = mUi->LabelCount;
  mModel = new ErrorJournalModel(this);
  mTable->setModel(mModel);
  mTable->verticalHeader()->setVisible(false);
  mTable->horizontalHeader()->setDefaultAlignment(Qt::AlignLeft | Qt::AlignVCenter);
  mTable->horizontalHeader()->setStretchLastSection(true);
  mTable->horizontalHeader()->setSectionResizeMode(ErrorJournalModel::kText, QHeaderView::Stretch);
  mTable->setColumnWidth(ErrorJournalModel::kTime, 70);
  mTable->setColumnWidth(ErrorJournalModel::kCode, 60);
  connect(mUi->PButCopy, &QPushButton::clicked, this, &ErrorErrorWin::HitPButCopy);
  connect(mUi->PButClear, &QPushButton::clicked, this, &ErrorErrorWin::HitPButClear);
  connect(mModel, &QAbstractItemModel::rowsInserted, this, [this] {
    ShowCount();
    Raise();
  });
  connect(mModel, &QAbstractItemModel::modelReset, this, &ErrorErrorWin::ShowCount);
  ShowCount();
  return 0;
}

void ErrorErrorWin::ShowCount() {
  const int shown = mModel->rowCount();
  mCount->setText(shown == 0 ? QStringLiteral("No errors in this session.")
                             : QStringLiteral("%1 error%2 in this session, newest first.").arg(shown).arg(shown == 1 ? "" : "s"));
}

// A new condition shows the list without taking the focus from where the user is typing.
void ErrorErrorWin::Raise() {
  if (auto* sub = qobject_cast<QMdiSubWindow*>(parentWidget())) {
    sub->showNormal();
    sub->raise();
  } else {
    raise();
  }
}

QString ErrorErrorWin::RowsAsText() const { return mModel->RowsAsText(mTable->selectionModel()->selectedRows()); }

void ErrorErrorWin::HitPButCopy() { QApplication::clipboard()->setText(RowsAsText()); }

void ErrorErrorWin::HitPButClear() { ErrorJournal::Clear(); }
