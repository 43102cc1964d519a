#include "windows/smseqedit/SmseqeditWin.h"

#include <QAction>
#include <QHeaderView>
#include <QLabel>
#include <QLayout>
#include <QPushButton>
#include <QTableWidget>

#include "params/ui/BoundControl.h"
#include "segments/SegmentCatalogFollower.h"
#include "sequences/CSequence.h"
#include "sequences/CSequenceBlock.h"
#include "sequences/SequenceCellEdit.h"
#include "sequences/SequenceService.h"
#include "sequences/SequenceUndo.h"
#include "sequences/ui/LoopGridManager.h"
#include "sequences/ui/SequenceFollower.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "windows/common/PortHeader.h"
#include "windows/common/SequenceFileMenu.h"
#include "windows/common/WindowOpener.h"

SmseqeditWin::SmseqeditWin(QWidget* parent) : QWidget(parent), mFollower(std::make_unique<SequenceFollower>(this, [this] { Rebuild(); })) {
  setObjectName(QStringLiteral("SmseqeditWin"));
}

SmseqeditWin::~SmseqeditWin() = default;

CSequence* SmseqeditWin::GetSequence() { return SequenceService::GetSequence(); }

int SmseqeditWin::Load(ConditionList& list) {
  if (int status = ResourceLibrary::LoadInto("smseqedit.Win", this, list)) return status;
  mTable = findChild<QTableWidget*>(QStringLiteral("TableBlocks"));
  mState = findChild<QLabel*>(QStringLiteral("LabelState"));
  auto* add = findChild<QPushButton*>(QStringLiteral("PButAdd"));
  auto* remove = findChild<QPushButton*>(QStringLiteral("PButDelete"));
  auto* up = findChild<QPushButton*>(QStringLiteral("PButUp"));
  auto* down = findChild<QPushButton*>(QStringLiteral("PButDown"));
  mOpenSegment = findChild<QPushButton*>(QStringLiteral("PButOpenSegment"));
  if (mTable == nullptr || mState == nullptr || add == nullptr || remove == nullptr || up == nullptr || down == nullptr ||
      mOpenSegment == nullptr || GetSequence() == nullptr) {
    list.Add(1, "The window resource \"smseqedit.Win\" lacks its table or buttons, or there is no sequence.");
    return 1;
  }
  connect(add, &QPushButton::clicked, this, [this] { Run([this](ConditionList& l) { return AddBlock(l); }); });
  connect(remove, &QPushButton::clicked, this, [this] { Run([this](ConditionList& l) { return DeleteBlock(l); }); });
  connect(up, &QPushButton::clicked, this, [this] { Run([this](ConditionList& l) { return MoveBlock(-1, l); }); });
  connect(down, &QPushButton::clicked, this, [this] { Run([this](ConditionList& l) { return MoveBlock(1, l); }); });
  layout()->setContentsMargins(8, 6, 8, 6);
  setFocusProxy(mTable);
  connect(mTable, &QTableWidget::cellChanged, this, &SmseqeditWin::HitCellChanged);
  connect(mTable, &QTableWidget::currentCellChanged, this, [this] { mOpenSegment->setEnabled(!CurrentSegment().empty()); });
  connect(mOpenSegment, &QPushButton::clicked, this, &SmseqeditWin::HitPButOpenSegment);
  if (auto* file = findChild<QPushButton*>(QStringLiteral("PButSequenceFile"))) SequenceFileMenu::Attach(file, this);
  AddBlockActions();
  mTable->horizontalHeader()->setSectionResizeMode(QHeaderView::Interactive);
  mFollower->Follow(GetSequence());
  mUndo = std::make_unique<SequenceUndo>(*GetSequence());
  mCatalog = std::make_unique<SegmentCatalogFollower>([this] { Rebuild(); });
  int status = GetSequence()->ReadSequence(list, 0);
  if (int read = mCatalog->Read(list); status == 0) status = read;
  Rebuild();
  return status;
}

bool SmseqeditWin::IsEditable() const { return GetSequence() != nullptr && GetSequence()->GetLoops().empty(); }

unsigned long SmseqeditWin::CurrentBlock() const {
  return mTable->currentRow() < 0 ? 0 : static_cast<unsigned long>(mTable->currentRow()) + 1;
}

void SmseqeditWin::Rebuild() {
  const CSequence* sequence = GetSequence();
  mFollower->Refreshed();
  if (sequence == nullptr || mTable == nullptr) return;
  mFilling = true;
  const int current = mTable->currentRow();
  const int column = std::max(0, mTable->currentColumn());
  const unsigned long ports = sequence->GetNumPorts();
  mTable->setColumnCount(kFirstPortColumn + static_cast<int>(ports));
  mTable->setHorizontalHeaderItem(0, new QTableWidgetItem(QStringLiteral("Label")));
  mTable->setHorizontalHeaderItem(1, new QTableWidgetItem(QStringLiteral("Length")));
  // The sequence's ports are the data ports in the order of the configuration: a column each.
  for (unsigned long p = 1; p <= ports; ++p) {
    QString tip;
    auto* header = new QTableWidgetItem(PortHeader(p, &tip));
    header->setToolTip(tip);
    mTable->setHorizontalHeaderItem(kFirstPortColumn + static_cast<int>(p) - 1, header);
  }
  mTable->setRowCount(static_cast<int>(sequence->GetNumBlocks()));
  const bool editable = IsEditable();
  for (unsigned long b = 1; b <= sequence->GetNumBlocks(); ++b) {
    const int row = static_cast<int>(b - 1);
    QStringList texts = {QString::fromStdString(sequence->GetLabel(b)), QString::number(sequence->GetBlockLength(b))};
    for (unsigned long p = 1; p <= ports; ++p) texts << QString::fromStdString(sequence->GetSegment(b, p));
    // The cells are kept and their texts set: the table may be filled while a cell's edit is
    // being told.
    for (int c = 0; c < texts.size(); ++c) {
      QTableWidgetItem* item = mTable->item(row, c);
      if (item == nullptr) {
        item = new QTableWidgetItem;
        if (c == 1) item->setTextAlignment(Qt::AlignRight | Qt::AlignVCenter);
        mTable->setItem(row, c, item);
      }
      item->setText(texts[c]);
      item->setFlags(editable ? item->flags() | Qt::ItemIsEditable : item->flags() & ~Qt::ItemIsEditable);
      const bool missing =
          c >= kFirstPortColumn && IsMissing(b, static_cast<unsigned long>(c - kFirstPortColumn + 1));
      item->setForeground(missing ? QBrush(Qt::red) : QBrush());
      item->setToolTip(missing ? QStringLiteral("The instrument has no segment of this name.") : QString());
    }
  }
  if (mTable->rowCount() > 0) {
    mTable->setCurrentCell(std::clamp(current, 0, mTable->rowCount() - 1), std::min(column, mTable->columnCount() - 1));
  }
  mTable->resizeColumnsToContents();
  mTable->setColumnWidth(0, std::max(mTable->columnWidth(0), 120));
  mTable->setColumnWidth(1, std::max(mTable->columnWidth(1), 80));
  mState->setText(editable ? QStringLiteral("%1 %2. A change goes to the instrument as it is made.")
                                 .arg(mTable->rowCount())
                                 .arg(mTable->rowCount() == 1 ? QStringLiteral("block") : QStringLiteral("blocks"))
                           : QStringLiteral("This sequence has loops: it is shown here, but this editor changes only "
                                            "sequences without loops."));
  for (const char* name : {"PButAdd", "PButDelete", "PButUp", "PButDown"}) {
    if (auto* button = findChild<QPushButton*>(QLatin1String(name))) button->setEnabled(editable);
  }
  mFilling = false;
}

void SmseqeditWin::HitCellChanged(int row, int column) {
  if (mFilling || row < 0) return;
  const QString text = mTable->item(row, column)->text().trimmed();
  Run([this, row, column, &text](ConditionList& l) { return ApplyCell(static_cast<unsigned long>(row) + 1, column, text, l); });
}

int SmseqeditWin::ApplyCell(unsigned long block, int column, const QString& text, ConditionList& list) {
  CSequence* sequence = GetSequence();
  if (column == 0) return sequence->SetLabel(block, text.toStdString(), list);
  if (column == 1) return SequenceCellEdit::SetLength(*sequence, block, text.toStdString(), list);
  return SequenceCellEdit::SetSegment(*sequence, block, static_cast<unsigned long>(column - kFirstPortColumn + 1),
                                      text.toStdString(), list);
}

void SmseqeditWin::Run(const std::function<int(ConditionList&)>& command) {
  ConditionList list;
  const int status = mUndo->Run(command, list);
  // A refusal shows what the instrument holds; a step shows what it holds now.
  if (status != 0 || mFollower->IsStale()) Rebuild();
  BoundControl::Report(list);
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

bool SmseqeditWin::IsMissing(unsigned long block, unsigned long port) const {
  if (mCatalog == nullptr || GetSequence()->GetType(block, port) != CSequence::SEG_NAMED) return false;
  return mCatalog->IsMissing(GetSequence()->GetSegment(block, port));
}

Dstring SmseqeditWin::CurrentSegment() const {
  const int column = mTable->currentColumn();
  const unsigned long block = CurrentBlock();
  if (block == 0 || column < kFirstPortColumn) return {};
  const auto port = static_cast<unsigned long>(column - kFirstPortColumn + 1);
  return GetSequence()->GetType(block, port) == CSequence::SEG_NAMED ? GetSequence()->GetSegment(block, port) : Dstring();
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
  mTable->setCurrentCell(static_cast<int>(after), std::max(0, mTable->currentColumn()));
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
  mTable->setCurrentCell(static_cast<int>(static_cast<long>(block) - 1 + distance), std::max(0, mTable->currentColumn()));
  return 0;
}
