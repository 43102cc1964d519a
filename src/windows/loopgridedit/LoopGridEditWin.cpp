#include "windows/loopgridedit/LoopGridEditWin.h"

#include <QFontMetrics>
#include <QLabel>
#include <QLayout>
#include <QListWidget>
#include <QPushButton>
#include <QSplitter>

#include "core/uiapp.h"
#include "params/ui/BoundControl.h"
#include "segments/SegmentCatalogFollower.h"
#include "sequences/CSequence.h"
#include "sequences/SequenceLoopRules.h"
#include "sequences/SequenceService.h"
#include "sequences/ui/LoopGridManager.h"
#include "sequences/ui/SequenceFollower.h"
#include "toolkit/WaitCursor.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "windows/common/PortHeader.h"
#include "windows/common/SequenceFileMenu.h"
#include "windows/common/WindowOpener.h"
#include "ui_LoopGridEdit.Win.h"

LoopGridEditWin::LoopGridEditWin(QWidget* parent)
    : QWidget(parent), mFollower(std::make_unique<SequenceFollower>(this, [this] { ShowState(); })), mUi(std::make_unique<Ui::LoopGridEditWin>()) {
  setObjectName(QStringLiteral("LoopGridEditWin"));
}

LoopGridEditWin::~LoopGridEditWin() = default;

CSequence* LoopGridEditWin::GetSequence() {
  return SequenceService::GetSequence();
}

int LoopGridEditWin::Load(ConditionList& list) {
  mUi->setupUi(this);
  ResourceLibrary::InitWidgets(this);
  mGrid = mUi->GridLoops;
  mSegments = mUi->ListSegments;
  mState = mUi->LabelState;
  CSequence* sequence = GetSequence();
  if (sequence == nullptr) {
    list.Add(1, "There is no sequence to edit.");
    return 1;
  }
  mUi->Split->setStretchFactor(1, 1);
  setFocusProxy(mGrid);
  struct Button {
    QPushButton* button;
    std::function<void()> run;
  };
  const Button buttons[] = {
      {mUi->PButAddLoop, [this] { mGrid->AddLoop(); }},
      {mUi->PButRemoveLoop, [this] { mGrid->RemoveLoop(); }},
      {mUi->PButOpenSegment,
       [this] { HitPButOpenSegment(mGrid->CursorBlock(), mGrid->PortOf(mGrid->CursorField())); }},
      {mUi->PButEvents, [this] { HitPButEvents(mGrid->CursorBlock()); }},
      {mUi->PButSequence, [this] {
         if (WindowOpener* opener = WindowOpener::Of(this)) opener->OpenSequence();
       }},
      {mUi->PButRun, [this] { RunAction(&uiapp::Run); }},
      {mUi->PButStop, [this] { RunAction(&uiapp::Stop); }},
      {mUi->PButForce, [this] { RunAction(&uiapp::SequenceForce); }},
      {mUi->PButRefresh,
       [this] {
         ConditionList l;
         FillSegments(l);
         BoundControl::Report(l);
       }},
  };
  for (const Button& b : buttons) {
    QPushButton* button = b.button;
    // The keys belong to the grid: a button leaves the focus where it was.
    button->setFocusPolicy(Qt::NoFocus);
    connect(button, &QPushButton::clicked, this, [this, run = b.run] {
      run();
      mGrid->setFocus();
    });
  }
  mUi->PButSequenceFile->setFocusPolicy(Qt::NoFocus);
  SequenceFileMenu::Attach(mUi->PButSequenceFile, this);
  connect(mGrid, &LoopGridManager::OpenSegmentRequested, this, &LoopGridEditWin::HitPButOpenSegment);
  connect(mGrid, &LoopGridManager::OpenEventsRequested, this, &LoopGridEditWin::HitPButEvents);
  connect(mGrid, &GridManager::StateChanged, this, &LoopGridEditWin::ShowState);
  connect(mSegments, &QListWidget::itemActivated, this, &LoopGridEditWin::HitSegmentDoubleClicked);
  // The columns are narrow: the place goes down a line a part, in short words ("G1", "M2",
  // "P1", "gen") when even a part is wider than the column; the tool tip has it whole.
  mGrid->SetPortHeader([this](unsigned long port, int width) {
    QString header = PortHeader(port).replace(QStringLiteral(" \u203A "), QStringLiteral("\n"));
    const QFontMetrics metrics(mGrid->font());
    for (const QString& line : header.split(QLatin1Char('\n'))) {
      if (metrics.horizontalAdvance(line) > width) return ShortPortHeader(header);
    }
    return header;
  });
  // The levels are asked once a connection; when another client held the instrument then, now.
  if (!CSequence::IsNumLoopLevelsInitialized()) CSequence::InitNumLoopLevels(list);
  // Without the instrument's limit, the instrument refuses a count itself when it is written.
  unsigned long largest = 0;
  ConditionList ignored;
  if (SequenceLoopRules::ReadLargestCount(largest, ignored) == 0) mGrid->SetLargestCount(largest);
  mFollower->Follow(sequence);
  mCatalog = std::make_unique<SegmentCatalogFollower>([this] { ShowSegments(); });
  int status = sequence->ReadSequence(list, 0);
  mGrid->SetSequence(sequence);
  if (int rc = FillSegments(list); status == 0) status = rc;
  ShowState();
  return status;
}

int LoopGridEditWin::FillSegments(ConditionList& list) {
  const int status = mCatalog->Read(list);
  ShowSegments();
  return status;
}

void LoopGridEditWin::ShowSegments() {
  if (!mCatalog->IsRead()) return;
  QStringList items;
  for (const Dstring& name : mCatalog->GetNames()) items << QString::fromStdString(name);
  mSegments->clear();
  mSegments->addItems(items);
  mGrid->SetSegmentNames(items);
}

void LoopGridEditWin::ShowState() {
  const CSequence* sequence = GetSequence();
  if (sequence == nullptr || mState == nullptr) return;
  const unsigned long blocks = sequence->GetNumBlocks();
  QString cursor;
  if (mGrid->FirstSelected() != mGrid->LastSelected()) {
    cursor =
        QStringLiteral("Blocks %1\u2013%2 selected. ").arg(mGrid->FirstSelected()).arg(mGrid->LastSelected());
  } else if (mGrid->CursorBlock() != 0) {
    cursor = QStringLiteral("Block %1. ").arg(mGrid->CursorBlock());
  }
  mState->setText(QStringLiteral("%1%2 %3, %4 loop levels (the top runs for ever). Marks: M measure, S sync, "
                                 "T trigger, R reactions; a segment in red is not on the instrument.")
                      .arg(cursor)
                      .arg(blocks)
                      .arg(blocks == 1 ? QStringLiteral("block") : QStringLiteral("blocks"))
                      .arg(CSequence::GetNumLoopLevels()));
  const bool named =
      mGrid->PortOf(mGrid->CursorField()) != 0 &&
      sequence->GetType(mGrid->CursorBlock(), mGrid->PortOf(mGrid->CursorField())) == CSequence::SEG_NAMED;
  mUi->PButOpenSegment->setEnabled(named);
}

void LoopGridEditWin::RunAction(int (*action)(ConditionList&)) {
  ConditionList list;
  {
    WaitCursor wait;
    action(list);
  }
  BoundControl::Report(list);
}

void LoopGridEditWin::HitPButOpenSegment(unsigned long block, unsigned long port) {
  WindowOpener* opener = WindowOpener::Of(this);
  if (opener != nullptr && block != 0 && port != 0) opener->OpenSegment(block, port);
}

void LoopGridEditWin::HitPButEvents(unsigned long block) {
  WindowOpener* opener = WindowOpener::Of(this);
  if (opener != nullptr && block != 0) opener->OpenEvents(block);
}

// The segment goes into the cell under the cursor, as a drop there would put it.
void LoopGridEditWin::HitSegmentDoubleClicked() {
  QListWidgetItem* item = mSegments->currentItem();
  const int field = mGrid->CursorField();
  if (item == nullptr || mGrid->PortOf(field) == 0) return;
  mGrid->SetCellText(mGrid->CursorBlock(), field, item->text());
  mGrid->setFocus();
}
