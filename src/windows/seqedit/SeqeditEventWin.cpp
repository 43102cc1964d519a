#include "windows/seqedit/SeqeditEventWin.h"

#include <QCheckBox>
#include <QHeaderView>
#include <QLabel>
#include <QLayout>
#include <QPushButton>
#include <QSpinBox>
#include <QTableWidget>

#include "params/ui/BoundControl.h"
#include "sequences/CSequence.h"
#include "sequences/SequenceService.h"
#include "sequences/ui/SequenceFollower.h"
#include "toolkit/qt/ResourceLibrary.h"

namespace {

enum Column { kIf = 0, kGoto = 1, kTrigger = 2, kVxi = 3 };

}  // namespace

SeqeditEventWin::SeqeditEventWin(QWidget* parent)
    : QWidget(parent), mFollower(std::make_unique<SequenceFollower>(this, [this] { Fill(); })) {
  setObjectName(QStringLiteral("SeqeditEventWin"));
}

SeqeditEventWin::~SeqeditEventWin() = default;

int SeqeditEventWin::Load(ConditionList& list) {
  if (int status = ResourceLibrary::LoadInto("seqedit.EventWin", this, list)) return status;
  mBlockLabel = findChild<QLabel*>(QStringLiteral("LabelBlock"));
  mState = findChild<QLabel*>(QStringLiteral("LabelState"));
  mSync = findChild<QCheckBox*>(QStringLiteral("CheckSync"));
  mMeasure = findChild<QCheckBox*>(QStringLiteral("CheckMeasure"));
  mTrigger = findChild<QSpinBox*>(QStringLiteral("SpinTrigger"));
  mTable = findChild<QTableWidget*>(QStringLiteral("TableReactions"));
  mNew = findChild<QPushButton*>(QStringLiteral("PButNew"));
  mDelete = findChild<QPushButton*>(QStringLiteral("PButDelete"));
  CSequence* sequence = SequenceService::GetSequence();
  if (mBlockLabel == nullptr || mState == nullptr || mSync == nullptr || mMeasure == nullptr ||
      mTrigger == nullptr || mTable == nullptr || mNew == nullptr || mDelete == nullptr ||
      sequence == nullptr) {
    list.Add(
        1, "The window resource \"seqedit.EventWin\" lacks its table or controls, or there is no sequence.");
    return 1;
  }
  layout()->setContentsMargins(8, 6, 8, 6);
  mTable->horizontalHeader()->setStretchLastSection(true);
  mTable->horizontalHeader()->setSectionResizeMode(QHeaderView::Interactive);
  mTable->setColumnWidth(kIf, 160);
  mTable->setColumnWidth(kGoto, 160);
  mTable->setColumnWidth(kTrigger, 80);
  connect(mTable, &QTableWidget::cellChanged, this, [this](int row, int column) {
    if (!mFilling) SetReaction(static_cast<unsigned long>(row), column, mTable->item(row, column)->text());
  });
  connect(mNew, &QPushButton::clicked, this, [this] { NewReaction(); });
  connect(mDelete, &QPushButton::clicked, this, [this] {
    if (mTable->currentRow() >= 0) DeleteReaction(static_cast<unsigned long>(mTable->currentRow()));
  });
  connect(mSync, &QCheckBox::toggled, this, [this](bool on) {
    if (!mFilling) SetSync(on);
  });
  connect(mMeasure, &QCheckBox::toggled, this, [this](bool on) {
    if (!mFilling)
      Run([this, on](CSequence& s, ConditionList& l) {
        return s.SetBlockMeasurementStart(mBlock, on ? 1 : 0, l);
      });
  });
  connect(mTrigger, &QSpinBox::valueChanged, this, [this](int value) {
    if (!mFilling)
      Run([this, value](CSequence& s, ConditionList& l) {
        return s.SetBlockTrigger(mBlock, static_cast<unsigned long>(value), l);
      });
  });
  setFocusProxy(mTable);
  mFollower->Follow(sequence);
  const int status = sequence->ReadSequence(list, 0);
  Fill();
  return status;
}

void SeqeditEventWin::ShowBlock(unsigned long block) {
  mBlock = block;
  Fill();
}

void SeqeditEventWin::Fill() {
  mFollower->Refreshed();
  const CSequence* sequence = SequenceService::GetSequence();
  if (sequence == nullptr || mTable == nullptr) return;
  mFilling = true;
  const bool exists = mBlock >= 1 && mBlock <= sequence->GetNumBlocks();
  const Dstring label = exists ? sequence->GetLabel(mBlock) : Dstring();
  mBlockLabel->setText(!exists ? QStringLiteral("<b>Block %1</b> is no longer in the sequence.").arg(mBlock)
                       : label.empty() ? QStringLiteral("<b>Block %1</b>").arg(mBlock)
                                       : QStringLiteral("<b>Block %1</b> \u201C%2\u201D")
                                             .arg(mBlock)
                                             .arg(QString::fromStdString(label).toHtmlEscaped()));
  const bool sync = exists && sequence->GetBlockSync(mBlock) != 0;
  mSync->setChecked(sync);
  mMeasure->setChecked(exists && sequence->GetBlockMeasurementStart(mBlock) != 0);
  mTrigger->setValue(exists ? static_cast<int>(sequence->GetBlockTrigger(mBlock)) : 0);
  const unsigned long count = exists ? sequence->GetBlockNumBranches(mBlock) : 0;
  const int current = mTable->currentRow();
  mTable->setRowCount(static_cast<int>(count));
  for (unsigned long n = 0; n < count; ++n) {
    const QString texts[] = {QString::fromStdString(sequence->GetReactIf(mBlock, n)),
                             QString::fromStdString(sequence->GetReactGoto(mBlock, n)),
                             QString::number(sequence->GetReactTrig(mBlock, n)),
                             QString::fromStdString(sequence->GetReactVxi(mBlock, n))};
    for (int c = 0; c < 4; ++c) {
      QTableWidgetItem* item = mTable->item(static_cast<int>(n), c);
      if (item == nullptr) {
        item = new QTableWidgetItem;
        if (c == kTrigger) item->setTextAlignment(Qt::AlignRight | Qt::AlignVCenter);
        mTable->setItem(static_cast<int>(n), c, item);
      }
      item->setText(texts[c]);
    }
  }
  if (count > 0)
    mTable->setCurrentCell(std::clamp(current, 0, static_cast<int>(count) - 1),
                           std::max(0, mTable->currentColumn()));
  for (QWidget* w : std::initializer_list<QWidget*>{mSync, mMeasure, mTrigger}) w->setEnabled(exists);
  // A synchronisation block carries no reactions.
  mTable->setEnabled(exists && !sync);
  mNew->setEnabled(exists && !sync);
  mDelete->setEnabled(exists && !sync && count > 0);
  mState->setText(!exists ? QString()
                  : sync  ? QStringLiteral("A synchronisation block has no reactions.")
                          : QStringLiteral("%1 %2.").arg(count).arg(count == 1 ? QStringLiteral("reaction")
                                                                               : QStringLiteral("reactions")));
  mFilling = false;
}

int SeqeditEventWin::Run(const std::function<int(CSequence&, ConditionList&)>& edit) {
  CSequence* sequence = SequenceService::GetSequence();
  if (sequence == nullptr) return 0;
  ConditionList list;
  const int status = edit(*sequence, list);
  // Refused or not, the window shows what the instrument holds.
  Fill();
  BoundControl::Report(list);
  return status;
}

int SeqeditEventWin::NewReaction() {
  return Run([this](CSequence& s, ConditionList& l) { return s.NewReact(mBlock, l); });
}

int SeqeditEventWin::DeleteReaction(unsigned long n) {
  return Run([this, n](CSequence& s, ConditionList& l) { return s.DeleteReact(mBlock, n, l); });
}

int SeqeditEventWin::SetSync(bool sync) {
  return Run(
      [this, sync](CSequence& s, ConditionList& l) { return s.SetBlockSync(mBlock, sync ? 1 : 0, l); });
}

int SeqeditEventWin::SetReaction(unsigned long n, int column, const QString& text) {
  const Dstring value = text.trimmed().toStdString();
  return Run([&](CSequence& s, ConditionList& l) -> int {
    switch (column) {
      case kIf:
        return s.SetReactIf(mBlock, n, value, l);
      case kGoto:
        return s.SetReactGoto(mBlock, n, value, l);
      case kVxi:
        return s.SetReactVxi(mBlock, n, value, l);
      default:
        break;
    }
    unsigned long trigger = 0;
    if (value.empty() || value.find_first_not_of("0123456789") != Dstring::npos || !value.ToULong(trigger)) {
      l.Add(1, Dstring::Format("\"%s\" is no trigger: a whole number from 0.", value.c_str()));
      return 1;
    }
    return s.SetReactTrig(mBlock, n, trigger, l);
  });
}
