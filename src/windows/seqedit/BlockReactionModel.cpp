#include "windows/seqedit/BlockReactionModel.h"

#include "sequences/CSequence.h"
#include "windows/common/TableCell.h"

BlockReactionModel::BlockReactionModel(CSequence& sequence, unsigned long block, QObject* parent)
    : QAbstractTableModel(parent), mTable(sequence, block) {
  mRows = static_cast<int>(mTable.Rows());
  sequence.AddObserver(this);
}

BlockReactionModel::~BlockReactionModel() { mTable.Sequence().RemoveObserver(this); }

void BlockReactionModel::SetBlock(unsigned long block) {
  beginResetModel();
  mTable.SetBlock(block);
  mRows = static_cast<int>(mTable.Rows());
  endResetModel();
}

void BlockReactionModel::Reload() { SetBlock(mTable.Block()); }

void BlockReactionModel::Take() {
  if (static_cast<int>(mTable.Rows()) != mRows) {
    Reload();
    return;
  }
  if (mRows > 0) emit dataChanged(index(0, 0), index(mRows - 1, BlockReactionTable::kColumns - 1));
}

int BlockReactionModel::rowCount(const QModelIndex& parent) const { return parent.isValid() ? 0 : mRows; }

int BlockReactionModel::columnCount(const QModelIndex& parent) const {
  return parent.isValid() ? 0 : static_cast<int>(BlockReactionTable::kColumns);
}

QVariant BlockReactionModel::data(const QModelIndex& index, int role) const {
  if (!IsCellOf(*this, index)) return {};
  const auto column = static_cast<unsigned long>(index.column());
  if (role == Qt::DisplayRole || role == Qt::EditRole)
    return QString::fromStdString(mTable.Text(static_cast<unsigned long>(index.row()), column));
  if (role == Qt::TextAlignmentRole && column == BlockReactionTable::kTrigger)
    return QVariant(Qt::Alignment(Qt::AlignRight | Qt::AlignVCenter));
  return {};
}

QVariant BlockReactionModel::headerData(int section, Qt::Orientation orientation, int role) const {
  if (orientation == Qt::Vertical || role != Qt::DisplayRole) return QAbstractTableModel::headerData(section, orientation, role);
  return QString::fromStdString(BlockReactionTable::Heading(static_cast<unsigned long>(section)));
}

Qt::ItemFlags BlockReactionModel::flags(const QModelIndex& index) const {
  if (!IsCellOf(*this, index)) return Qt::NoItemFlags;
  const Qt::ItemFlags shown = Qt::ItemIsSelectable | Qt::ItemIsEnabled;
  return mTable.IsEditable(InstrumentHeld()) ? shown | Qt::ItemIsEditable : shown;
}

bool BlockReactionModel::setData(const QModelIndex& index, const QVariant& value, int role) {
  if (role != Qt::EditRole || !(flags(index) & Qt::ItemIsEditable)) return false;
  const auto n = static_cast<unsigned long>(index.row());
  const auto column = static_cast<unsigned long>(index.column());
  const Dstring text = value.toString().toStdString();
  return mRunner([&](ConditionList& list) { return mTable.Write(n, column, text, list); }) == 0;
}

// A block inserted or deleted at or above the block's number puts another block there.
int BlockReactionModel::NfyBlockInserted(unsigned long block, ConditionList&) {
  if (block <= mTable.Block()) Reload();
  return 0;
}

int BlockReactionModel::NfyBlockDeleted(unsigned long block, ConditionList&) {
  if (block <= mTable.Block()) Reload();
  return 0;
}

int BlockReactionModel::NfyBlockSyncChanged(unsigned long block, ConditionList&) {
  if (block == mTable.Block()) Take();
  return 0;
}

int BlockReactionModel::NfyBlockReactionsChanged(unsigned long block, ConditionList&) {
  if (block == mTable.Block()) Take();
  return 0;
}

int BlockReactionModel::NfySequence(ConditionList&) {
  Reload();
  return 0;
}
