#include "windows/seqedit/SeqeditEventWin.h"

#include <QCheckBox>
#include <QHeaderView>
#include <QLabel>
#include <QPushButton>
#include <QSpinBox>
#include <QTableView>

#include "params/ui/BoundControl.h"
#include "sequences/CSequence.h"
#include "sequences/SequenceService.h"
#include "sequences/ui/SequenceFollower.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "ui_seqedit.EventWin.h"
#include "windows/seqedit/BlockReactionModel.h"

SeqeditEventWin::SeqeditEventWin(QWidget* parent)
    : QWidget(parent), mFollower(std::make_unique<SequenceFollower>(this, [this] { Fill(); })), mUi(std::make_unique<Ui::SeqeditEventWin>()) {
  setObjectName(QStringLiteral("SeqeditEventWin"));
}

SeqeditEventWin::~SeqeditEventWin() = default;

int SeqeditEventWin::Load(ConditionList& list) {
  CSequence* sequence = SequenceService::GetSequence();
  if (sequence == nullptr) {
    list.Add(1, "The event window has no sequence to show.");
    return 1;
  }
  mUi->setupUi(this);
  ResourceLibrary::InitWidgets(this);
  mBlockLabel = mUi->LabelBlock;
  mState = mUi->LabelState;
  mSync = mUi->CheckSync;
  mMeasure = mUi->CheckMeasure;
  mTrigger = mUi->SpinTrigger;
  mTable = mUi->TableReactions;
  mNew = mUi->PButNew;
  mDelete = mUi->PButDelete;
  mModel = new BlockReactionModel(*sequence, mBlock, this);
  mModel->SetRunner([this](const std::function<int(ConditionList&)>& edit) {
    return Run([&edit](CSequence&, ConditionList& l) { return edit(l); });
  });
  mTable->setModel(mModel);
  mTable->horizontalHeader()->setStretchLastSection(true);
  mTable->horizontalHeader()->setSectionResizeMode(QHeaderView::Interactive);
  mTable->setColumnWidth(BlockReactionTable::kIf, 160);
  mTable->setColumnWidth(BlockReactionTable::kGoto, 160);
  mTable->setColumnWidth(BlockReactionTable::kTrigger, 80);
  // The current line is kept where it was when the reactions are taken afresh.
  connect(mModel, &QAbstractItemModel::modelAboutToBeReset, this, [this] {
    if (mTable->currentIndex().isValid()) mLastRow = mTable->currentIndex().row(), mLastColumn = mTable->currentIndex().column();
  });
  connect(mModel, &QAbstractItemModel::modelReset, this, &SeqeditEventWin::Fill);
  connect(mNew, &QPushButton::clicked, this, [this] { NewReaction(); });
  connect(mDelete, &QPushButton::clicked, this, [this] {
    if (mTable->currentIndex().isValid()) DeleteReaction(static_cast<unsigned long>(mTable->currentIndex().row()));
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
  if (mModel != nullptr) mModel->SetBlock(block);
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
  const unsigned long count = static_cast<unsigned long>(mModel->rowCount());
  if (count > 0 && !mTable->currentIndex().isValid()) {
    mTable->setCurrentIndex(mModel->index(std::clamp(mLastRow, 0, static_cast<int>(count) - 1), std::max(0, mLastColumn)));
  }
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
