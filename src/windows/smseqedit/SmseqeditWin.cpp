#include "windows/smseqedit/SmseqeditWin.h"

#include <QAction>
#include <QHeaderView>
#include <QLabel>
#include <QPushButton>
#include <QTableView>

#include "params/ui/BoundControl.h"
#include "segments/SegmentCatalogFollower.h"
#include "sequences/CSequence.h"
#include "sequences/CSequenceBlock.h"
#include "sequences/SequenceService.h"
#include "sequences/SequenceUndo.h"
#include "sequences/ui/LoopGridManager.h"
#include "sequences/ui/SequenceFollower.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "ui_smseqedit.Win.h"
#include "windows/common/PortHeader.h"
#include "windows/common/SequenceFileMenu.h"
#include "windows/common/WindowOpener.h"
#include "windows/smseqedit/SequenceBlockModel.h"

SmseqeditWin::SmseqeditWin(QWidget* parent)
    : QWidget(parent), mFollower(std::make_unique<SequenceFollower>(this, [this] { Rebuild(); })), mUi(std::make_unique<Ui::SmseqeditWin>()) {
  setObjectName(QStringLiteral("SmseqeditWin"));
}

SmseqeditWin::~SmseqeditWin() = default;

CSequence* SmseqeditWin::GetSequence() { return SequenceService::GetSequence(); }

int SmseqeditWin::Load(ConditionList& list) {
  if (GetSequence() == nullptr) {
    list.Add(1, "The simple sequence editor has no sequence to show.");
    return 1;
  }
  mUi->setupUi(this);
  ResourceLibrary::InitWidgets(this);
  mTable = mUi->TableBlocks;
  mState = mUi->LabelState;
  mOpenSegment = mUi->PButOpenSegment;
  connect(mUi->PButAdd, &QPushButton::clicked, this, [this] { Run([this](ConditionList& l) { return AddBlock(l); }); });
  connect(mUi->PButDelete, &QPushButton::clicked, this, [this] { Run([this](ConditionList& l) { return DeleteBlock(l); }); });
  connect(mUi->PButUp, &QPushButton::clicked, this, [this] { Run([this](ConditionList& l) { return MoveBlock(-1, l); }); });
  connect(mUi->PButDown, &QPushButton::clicked, this, [this] { Run([this](ConditionList& l) { return MoveBlock(1, l); }); });
  setFocusProxy(mTable);
  mUndo = std::make_unique<SequenceUndo>(*GetSequence());
  mCatalog = std::make_unique<SegmentCatalogFollower>([this] {
    if (mModel != nullptr) mModel->MissingChanged();
  });
  int status = GetSequence()->ReadSequence(list, 0);
  if (int read = mCatalog->Read(list); status == 0) status = read;
  mModel = new SequenceBlockModel(
      *GetSequence(), [this](const Dstring& name) { return mCatalog->IsMissing(name); }, this);
  mModel->SetRunner([this](const std::function<int(ConditionList&)>& edit) { return Run(edit); });
  mTable->setModel(mModel);
  connect(mTable->selectionModel(), &QItemSelectionModel::currentChanged, this, [this](const QModelIndex& current) {
    if (current.isValid()) mLastRow = current.row(), mLastColumn = current.column();
    mOpenSegment->setEnabled(!CurrentSegment().empty());
  });
  // A whole new sequence (other ports) keeps the current line where it was.
  connect(mModel, &QAbstractItemModel::modelReset, this, &SmseqeditWin::Rebuild);
  connect(mOpenSegment, &QPushButton::clicked, this, &SmseqeditWin::HitPButOpenSegment);
  SequenceFileMenu::Attach(mUi->PButSequenceFile, this);
  AddBlockActions();
  mTable->horizontalHeader()->setSectionResizeMode(QHeaderView::Interactive);
  mFollower->Follow(GetSequence());
  Rebuild();
  return status;
}

bool SmseqeditWin::IsEditable() const { return GetSequence() != nullptr && mModel != nullptr && mModel->Table().IsEditable(false); }

unsigned long SmseqeditWin::CurrentBlock() const {
  const QModelIndex current = mTable->currentIndex();
  return current.isValid() ? static_cast<unsigned long>(current.row()) + 1 : 0;
}

void SmseqeditWin::Rebuild() {
  mFollower->Refreshed();
  if (mModel == nullptr) return;
  const int rows = mModel->rowCount();
  if (rows > 0 && !mTable->currentIndex().isValid()) {
    mTable->setCurrentIndex(mModel->index(std::clamp(mLastRow, 0, rows - 1), std::clamp(mLastColumn, 0, mModel->columnCount() - 1)));
  }
  mTable->resizeColumnsToContents();
  mTable->setColumnWidth(0, std::max(mTable->columnWidth(0), 120));
  mTable->setColumnWidth(1, std::max(mTable->columnWidth(1), 80));
  const bool editable = IsEditable();
  mState->setText(editable ? QStringLiteral("%1 %2. A change goes to the instrument as it is made.")
                                 .arg(rows)
                                 .arg(rows == 1 ? QStringLiteral("block") : QStringLiteral("blocks"))
                           : QStringLiteral("This sequence has loops: it is shown here, but this editor changes only "
                                            "sequences without loops."));
  for (QPushButton* button : {mUi->PButAdd, mUi->PButDelete, mUi->PButUp, mUi->PButDown}) button->setEnabled(editable);
  mOpenSegment->setEnabled(!CurrentSegment().empty());
}

int SmseqeditWin::Run(const std::function<int(ConditionList&)>& command) {
  ConditionList list;
  const int status = mUndo->Run(command, list);
  if (mFollower->IsStale()) Rebuild();
  BoundControl::Report(list);
  return status;
}

bool SmseqeditWin::CanUndo() const { return mUndo && mUndo->CanUndo(); }

// A sequence with loops is not this editor's to change, not even back.
int SmseqeditWin::Undo(ConditionList& list) {
  const int status = IsEditable() ? mUndo->Undo(list) : 0;
  Rebuild();
  return status;
}

int SmseqeditWin::Redo(ConditionList& list) {
  const int status = IsEditable() ? mUndo->Redo(list) : 0;
  Rebuild();
  return status;
}

// Cut, copy and paste of whole blocks, on the table's keys and its context menu; the keys are
// the table's own, so a cell being edited keeps them for its text.
void SmseqeditWin::AddBlockActions() {
  struct Entry {
    const char* name;
    const char* text;
    QKeySequence key;
    std::function<int(CSequence&, unsigned long, ConditionList&)> run;
  };
  const Entry entries[] = {
      {"CutBlock", "Cu&t Block", QKeySequence::Cut, [](CSequence& s, unsigned long b, ConditionList& l) { return s.CutBlock(b, l); }},
      {"CopyBlock", "&Copy Block", QKeySequence::Copy, [](CSequence& s, unsigned long b, ConditionList& l) { return s.CopyBlock(b, l); }},
      {"PasteBlock", "&Paste Block After", QKeySequence::Paste,
       [](CSequence& s, unsigned long b, ConditionList& l) { return s.PasteBlockAfter(b, l); }},
  };
  const bool undo[] = {true, false};
  for (const bool back : undo) {
    int (SmseqeditWin::*step)(ConditionList&) = back ? &SmseqeditWin::Undo : &SmseqeditWin::Redo;
    auto* action = new QAction(back ? QStringLiteral("&Undo") : QStringLiteral("&Redo"), mTable);
    action->setObjectName(back ? QStringLiteral("Undo") : QStringLiteral("Redo"));
    // Redo has the loop grid's keys, so that both sequence editors answer the same.
    action->setShortcuts(back ? QKeySequence::keyBindings(QKeySequence::Undo) : LoopGridManager::RedoKeys());
    action->setShortcutContext(Qt::WidgetShortcut);
    mTable->addAction(action);
    connect(action, &QAction::triggered, this, [this, step = step] {
      ConditionList l;
      (this->*step)(l);
      BoundControl::Report(l);
    });
  }
  for (const Entry& e : entries) {
    auto* action = new QAction(QString::fromUtf8(e.text), mTable);
    action->setObjectName(QLatin1String(e.name));
    action->setShortcut(e.key);
    action->setShortcutContext(Qt::WidgetShortcut);
    mTable->addAction(action);
    connect(action, &QAction::triggered, this, [this, run = e.run] {
      if (!IsEditable()) return;
      Run([this, &run](ConditionList& l) { return CurrentBlock() == 0 ? 0 : run(*GetSequence(), CurrentBlock(), l); });
    });
  }
  mTable->setContextMenuPolicy(Qt::ActionsContextMenu);
}

Dstring SmseqeditWin::CurrentSegment() const {
  return mModel == nullptr ? Dstring() : mModel->NamedSegment(mTable->currentIndex());
}

// The segment editor of the main window shows the segment; asking again raises the same window.
void SmseqeditWin::HitPButOpenSegment() {
  const Dstring name = CurrentSegment();
  WindowOpener* opener = WindowOpener::Of(this);
  if (!name.empty() && opener != nullptr) opener->ShowSegment(name);
}

int SmseqeditWin::AddBlock(ConditionList& list) {
  const unsigned long after = CurrentBlock();
  if (int status = GetSequence()->AddBlockAfter(after, list)) return status;
  SetCurrentRow(static_cast<int>(after));
  return 0;
}

int SmseqeditWin::DeleteBlock(ConditionList& list) {
  const unsigned long block = CurrentBlock();
  return block == 0 ? 0 : GetSequence()->DeleteBlock(block, list);
}

int SmseqeditWin::MoveBlock(long distance, ConditionList& list) {
  const unsigned long block = CurrentBlock();
  if (block == 0) return 0;
  if (int status = GetSequence()->MoveBlock(block, distance, list)) return status;
  SetCurrentRow(static_cast<int>(static_cast<long>(block) - 1 + distance));
  return 0;
}

void SmseqeditWin::SetCurrentRow(int row) {
  mTable->setCurrentIndex(mModel->index(row, std::max(0, mTable->currentIndex().column())));
}
