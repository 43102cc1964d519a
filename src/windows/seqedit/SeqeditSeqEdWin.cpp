#include "windows/seqedit/SeqeditSeqEdWin.h"

#include <QHeaderView>
#include <QLabel>
#include <QLayout>
#include <QListWidget>
#include <QPushButton>
#include <QTableWidget>

#include "sequences/CPortInfo.h"
#include "sequences/CSequence.h"
#include "sequences/ui/LoopGridManager.h"
#include "sequences/ui/SequenceFollower.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "windows/MainWin.h"
#include "windows/seqedit/SequenceWindows.h"

SeqeditSeqEdWin::SeqeditSeqEdWin(QWidget* parent)
    : QWidget(parent), mFollower(std::make_unique<SequenceFollower>(this, [this] { Fill(); })) {
  setObjectName(QStringLiteral("SeqeditSeqEdWin"));
}

SeqeditSeqEdWin::~SeqeditSeqEdWin() = default;

int SeqeditSeqEdWin::Load(ConditionList& list) {
  if (int status = ResourceLibrary::LoadInto("seqedit.SeqEdWin", this, list)) return status;
  mSummary = findChild<QLabel*>(QStringLiteral("LabelSummary"));
  mTable = findChild<QTableWidget*>(QStringLiteral("TableBlocks"));
  mEventsLabel = findChild<QLabel*>(QStringLiteral("LabelEvents"));
  mEvents = findChild<QListWidget*>(QStringLiteral("ListEvents"));
  auto* events = findChild<QPushButton*>(QStringLiteral("PButEvents"));
  auto* grid = findChild<QPushButton*>(QStringLiteral("PButLoopGrid"));
  auto* simple = findChild<QPushButton*>(QStringLiteral("PButSimple"));
  CSequence* sequence = CPortInfo::GetSequence();
  if (mSummary == nullptr || mTable == nullptr || mEventsLabel == nullptr || mEvents == nullptr ||
      events == nullptr || grid == nullptr || simple == nullptr || sequence == nullptr) {
    list.Add(1,
             "The window resource \"seqedit.SeqEdWin\" lacks its table or buttons, or there is no sequence.");
    return 1;
  }
  layout()->setContentsMargins(8, 6, 8, 6);
  mTable->horizontalHeader()->setStretchLastSection(true);
  setFocusProxy(mTable);
  auto openEvents = [this] {
    if (CurrentBlock() != 0) SequenceWindows::OpenEvents(this, CurrentBlock());
  };
  connect(events, &QPushButton::clicked, this, openEvents);
  connect(mTable, &QTableWidget::cellActivated, this, openEvents);
  auto open = [this](const char* resource) {
    if (auto* main = qobject_cast<MainWin*>(window())) main->OpenWindow(QLatin1String(resource));
  };
  connect(grid, &QPushButton::clicked, this, [open] { open("LoopGridEdit.Win"); });
  connect(simple, &QPushButton::clicked, this, [open] { open("smseqedit.Win"); });
  mFollower->Follow(sequence);
  const int status = sequence->ReadSequence(list, 0);
  Fill();
  return status;
}

unsigned long SeqeditSeqEdWin::CurrentBlock() const {
  return mTable->currentRow() < 0 ? 0 : static_cast<unsigned long>(mTable->currentRow()) + 1;
}

QString SeqeditSeqEdWin::LoopsOf(unsigned long block) {
  const CSequence* sequence = CPortInfo::GetSequence();
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
  const CSequence* sequence = CPortInfo::GetSequence();
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
  const CSequence* sequence = CPortInfo::GetSequence();
  mEvents->clear();
  if (!CPortInfo::HasCentral()) {
    mEventsLabel->setText(
        QStringLiteral("Sequence events: this system has no central module, so the sequencer has none."));
    mEvents->hide();
    return;
  }
  mEventsLabel->setText(QStringLiteral("Sequence events of the central module"));
  mEvents->show();
  const auto& events = sequence->GetEvents().GetEvents();
  for (std::size_t i = 0; i < events.size(); ++i) {
    const CSequenceEvents::Event& e = events[i];
    mEvents->addItem(QStringLiteral("%1. %2  (%3), %4 %5")
                         .arg(i + 1)
                         .arg(e.name.empty() ? QStringLiteral("(unnamed)") : QString::fromStdString(e.name))
                         .arg(e.number)
                         .arg(e.items.size())
                         .arg(e.items.size() == 1 ? QStringLiteral("item") : QStringLiteral("items")));
  }
}
