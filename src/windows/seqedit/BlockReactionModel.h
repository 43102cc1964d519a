#pragma once

#include <QAbstractTableModel>

#include "sequences/BlockReactionTable.h"
#include "sequences/CSequenceObserver.h"
#include "windows/common/TableEdit.h"

// The reactions of one block as a table model over the sequence (BlockReactionTable says what
// a cell shows and writes). It follows the model's reports: when the block's reactions change
// and their number stays, the rows changed; when their number changes, or another block comes
// to stand at the block's number, a reset. A typed cell goes through the runner; a
// synchronisation block, a block that is gone, and the instrument held by another client take
// no edit.
class BlockReactionModel : public QAbstractTableModel, public CSequenceObserver {
  Q_OBJECT

 public:
  BlockReactionModel(CSequence& sequence, unsigned long block, QObject* parent = nullptr);
  ~BlockReactionModel() override;

  const BlockReactionTable& Table() const { return mTable; }
  void SetRunner(TableEditRunner runner) { mRunner = std::move(runner); }
  // Shows block `block` (from 1).
  void SetBlock(unsigned long block);

  int rowCount(const QModelIndex& parent = {}) const override;
  int columnCount(const QModelIndex& parent = {}) const override;
  QVariant data(const QModelIndex& index, int role = Qt::DisplayRole) const override;
  QVariant headerData(int section, Qt::Orientation orientation, int role = Qt::DisplayRole) const override;
  Qt::ItemFlags flags(const QModelIndex& index) const override;
  bool setData(const QModelIndex& index, const QVariant& value, int role = Qt::EditRole) override;

  int NfyBlockInserted(unsigned long block, ConditionList& cond) override;
  int NfyBlockDeleted(unsigned long block, ConditionList& cond) override;
  int NfyBlockSyncChanged(unsigned long block, ConditionList& cond) override;
  int NfyBlockReactionsChanged(unsigned long block, ConditionList& cond) override;
  int NfySequence(ConditionList& cond) override;

 private:
  void Reload();
  // The block's reactions changed: the rows, or all of it when their number did.
  void Take();

  BlockReactionTable mTable;
  TableEditRunner mRunner = ReportedEdit;
  int mRows = 0;
};
