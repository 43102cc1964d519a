#include "windows/seqedit/SeqeditSeqEdWin.h"

#include <QHeaderView>
#include <QLabel>
#include <QLayout>
#include <QPushButton>
#include <QTableWidget>

#include "params/ui/BoundControl.h"
#include "sequences/CPortInfo.h"
#include "sequences/CSequence.h"
#include "sequences/SequenceService.h"
#include "sequences/ui/LoopGridManager.h"
#include "sequences/ui/SequenceFollower.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "windows/common/SequenceFileMenu.h"
#include "windows/common/WindowOpener.h"
#include "ui_seqedit.SeqEdWin.h"

SeqeditSeqEdWin::SeqeditSeqEdWin(QWidget* parent)
    : QWidget(parent), mFollower(std::make_unique<SequenceFollower>(this, [this] { Fill(); })), mUi(std::make_unique<Ui::SeqeditSeqEdWin>()) {
  setObjectName(QStringLiteral("SeqeditSeqEdWin"));
}

SeqeditSeqEdWin::~SeqeditSeqEdWin() = default;

int SeqeditSeqEdWin::Load(ConditionList& list) {
  mUi->setupUi(this);
  ResourceLibrary::InitWidgets(this);
  mSummary = mUi->LabelSummary;
  mTable = mUi->TableBlocks;
  mEventsLabel = mUi->LabelEvents;
  mEvents = mUi->TableEvents;
  auto* events = mUi->PButEvents;
  auto* grid = mUi->PButLoopGrid;
  auto* simple = mUi->PButSimple;
  CSequence* sequence = SequenceService::GetSequence();
  if (sequence == nullptr) {
    list.Add(1, "There is no sequence to edit.");
    return 1;
  }
  mTable->horizontalHeader()->setStretchLastSection(true);
  mEvents->horizontalHeader()->setStretchLastSection(true);
  mEvents->setColumnWidth(0, 160);
  connect(mEvents, &QTableWidget::cellChanged, this, [this](int row, int column) {
    if (!mFillingEvents) SetEventField(row, column, mEvents->item(row, column)->text());
  });
  setFocusProxy(mTable);
  auto openEvents = [this] {
    WindowOpener* opener = WindowOpener::Of(this);
    if (opener != nullptr && CurrentBlock() != 0) opener->OpenEvents(CurrentBlock());
  };
  connect(events, &QPushButton::clicked, this, openEvents);
  connect(mTable, &QTableWidget::cellActivated, this, openEvents);
  auto open = [this](const char* resource) {
    if (WindowOpener* opener = WindowOpener::Of(this)) opener->OpenWindow(QLatin1String(resource));
  };
  connect(grid, &QPushButton::clicked, this, [open] { open("LoopGridEdit.Win"); });
  connect(simple, &QPushButton::clicked, this, [open] { open("smseqedit.Win"); });
  SequenceFileMenu::Attach(mUi->PButSequenceFile, this);
  mFollower->Follow(sequence);
  const int status = sequence->ReadSequence(list, 0);
  Fill();
  return status;
}

unsigned long SeqeditSeqEdWin::CurrentBlock() const {
  return mTable->currentRow() < 0 ? 0 : static_cast<unsigned long>(mTable->currentRow()) + 1;
}

QString SeqeditSeqEdWin::LoopsOf(unsigned long block) {
  const CSequence* sequence = SequenceService::GetSequence();
  QStringList loops;
  for (unsigned long level = CSequence::GetNumLoopLevels(); sequence != nullptr && level >= 1; --level) {
    if (sequence->GetLoopStatus(block, level) == CSequence::LOOP_NONE) continue;
    const unsigned long n = sequence->GetNumIterations(block, level);
    loops << QStringLiteral("L%1 %2 %3\u2013%4")
                 .arg(level)
                 .arg(n == 0 ? QStringLiteral("\u221E") : QStringLiteral("\u00D7%1").arg(n))
                 .arg(sequence->GetLoopStart(block, level))
                 .arg(sequence->GetLoopEnd(block, level));
  }
  return loops.join(QStringLiteral("   "));
}

void SeqeditSeqEdWin::Fill() {
  mFollower->Refreshed();
  const CSequence* sequence = SequenceService::GetSequence();
  if (sequence == nullptr || mTable == nullptr) return;
  const unsigned long blocks = sequence->GetNumBlocks();
  const int current = mTable->currentRow();
  mTable->setRowCount(static_cast<int>(blocks));
  for (unsigned long b = 1; b <= blocks; ++b) {
    QStringList reactions;
    for (unsigned long n = 0; n < sequence->GetBlockNumBranches(b); ++n) {
      reactions << QStringLiteral("%1 \u2192 %2")
                       .arg(QString::fromStdString(sequence->GetReactIf(b, n)),
                            QString::fromStdString(sequence->GetReactGoto(b, n)));
    }
    const QString texts[] = {QString::fromStdString(sequence->GetLabel(b)),
                             QString::number(sequence->GetBlockLength(b)), LoopsOf(b),
                             LoopGridManager::MarksOf(*sequence, b), reactions.join(QStringLiteral("; "))};
    for (int c = 0; c < 5; ++c) {
      QTableWidgetItem* item = mTable->item(static_cast<int>(b - 1), c);
      if (item == nullptr) {
        item = new QTableWidgetItem;
        if (c == 1) item->setTextAlignment(Qt::AlignRight | Qt::AlignVCenter);
        mTable->setItem(static_cast<int>(b - 1), c, item);
      }
      item->setText(texts[c]);
    }
  }
  if (blocks > 0) mTable->setCurrentCell(std::clamp(current, 0, static_cast<int>(blocks) - 1), 0);
  mTable->resizeColumnsToContents();
  mTable->setColumnWidth(0, std::max(mTable->columnWidth(0), 120));
  const std::size_t loops = sequence->GetLoops().size();
  mSummary->setText(QStringLiteral("%1 %2, %3 %4 on %5 loop levels (the top level runs for ever). "
                                   "Marks: M measurement start, S sync block, T trigger, R reactions.")
                        .arg(blocks)
                        .arg(blocks == 1 ? QStringLiteral("block") : QStringLiteral("blocks"))
                        .arg(loops)
                        .arg(loops == 1 ? QStringLiteral("loop") : QStringLiteral("loops"))
                        .arg(CSequence::GetNumLoopLevels()));
  FillEvents();
}

// The ten events belong to a central module; without one the sequencer has none.
void SeqeditSeqEdWin::FillEvents() {
  const CSequence* sequence = SequenceService::GetSequence();
  const bool central = CPortInfo::HasCentral();
  mEventsLabel->setText(
      central
          ? QStringLiteral("Sequence events of the central module (name and number are edited here)")
          : QStringLiteral("Sequence events: this system has no central module, so the sequencer has none."));
  mEvents->setVisible(central);
  if (!central) return;
  mFillingEvents = true;
  const auto& events = sequence->GetEvents().GetEvents();
  mEvents->setRowCount(static_cast<int>(events.size()));
  for (std::size_t i = 0; i < events.size(); ++i) {
    const CSequenceEvents::Event& e = events[i];
    QStringList items;
    for (const CSequenceEvents::Item& item : e.items) {
      items << QStringLiteral("('%1','%2','%3',%4)")
                   .arg(QString::fromStdString(item.first), QString::fromStdString(item.second),
                        QString::fromStdString(item.third), QString::fromStdString(item.bare));
    }
    const QString texts[] = {QString::fromStdString(e.name), QString::number(e.number),
                             items.join(QStringLiteral("; "))};
    for (int c = 0; c < 3; ++c) {
      QTableWidgetItem* cell = mEvents->item(static_cast<int>(i), c);
      if (cell == nullptr) {
        cell = new QTableWidgetItem;
        if (c == 1) cell->setTextAlignment(Qt::AlignRight | Qt::AlignVCenter);
        if (c == 2) cell->setFlags(cell->flags() & ~Qt::ItemIsEditable);
        mEvents->setItem(static_cast<int>(i), c, cell);
      }
      cell->setText(texts[c]);
    }
  }
  mFillingEvents = false;
}

int SeqeditSeqEdWin::SetEventField(int index, int column, const QString& text) {
  CSequence* sequence = SequenceService::GetSequence();
  if (sequence == nullptr || index < 0 || index >= static_cast<int>(CSequenceEvents::kNumEvents)) return 0;
  CSequenceEvents::Event event = sequence->GetEvents().GetEvent(static_cast<std::size_t>(index));
  ConditionList list;
  int status = 0;
  if (column == 0) {
    event.name = text.trimmed().toStdString();
  } else if (column == 1) {
    bool number = false;
    event.number = text.trimmed().toInt(&number);
    if (!number) {
      list.Add(1, Dstring::Format("\"%s\" is no event number: a whole number.", text.toStdString().c_str()));
      status = 1;
    }
  }
  if (status == 0) status = sequence->SetEvent(static_cast<std::size_t>(index), event, list);
  // Refused or not, the table shows what the instrument holds.
  FillEvents();
  BoundControl::Report(list);
  return status;
}
