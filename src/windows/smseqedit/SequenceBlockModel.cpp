#include "windows/smseqedit/SequenceBlockModel.h"

#include <QBrush>

#include "sequences/CSequence.h"
#include "windows/common/PortHeader.h"
#include "windows/common/TableCell.h"

SequenceBlockModel::SequenceBlockModel(CSequence& sequence, std::function<bool(const Dstring&)> missing,
                                       QObject* parent)
    : QAbstractTableModel(parent), mTable(sequence), mMissing(std::move(missing)) {
  Reload();
  sequence.AddObserver(this);
}

SequenceBlockModel::~SequenceBlockModel() { mTable.Sequence().RemoveObserver(this); }

SequenceBlockModel::Row SequenceBlockModel::ReadRow(unsigned long block) const {
  Row row;
  for (unsigned long c = 0; c < mTable.Columns(); ++c) {
    row.cells << QString::fromStdString(mTable.Text(block, c));
    if (c >= SequenceBlockTable::kFirstPort) row.named.push_back(mTable.NamedSegment(block, c));
  }
  return row;
}

void SequenceBlockModel::Reload() {
  beginResetModel();
  mColumns = static_cast<int>(mTable.Columns());
  mRows.clear();
  for (unsigned long b = 1; b <= mTable.Rows(); ++b) mRows.push_back(ReadRow(b));
  endResetModel();
}

void SequenceBlockModel::MissingChanged() {
  if (mRows.empty() || mColumns <= static_cast<int>(SequenceBlockTable::kFirstPort)) return;
  emit dataChanged(index(0, SequenceBlockTable::kFirstPort), index(rowCount() - 1, mColumns - 1),
                   {Qt::ForegroundRole, Qt::ToolTipRole});
}

Dstring SequenceBlockModel::NamedSegment(const QModelIndex& index) const {
  if (!IsCellOf(*this, index) || index.column() < static_cast<int>(SequenceBlockTable::kFirstPort))
    return {};
  return mRows[static_cast<std::size_t>(index.row())].named[static_cast<std::size_t>(index.column()) - SequenceBlockTable::kFirstPort];
}

int SequenceBlockModel::rowCount(const QModelIndex& parent) const {
  return parent.isValid() ? 0 : static_cast<int>(mRows.size());
}

int SequenceBlockModel::columnCount(const QModelIndex& parent) const { return parent.isValid() ? 0 : mColumns; }

QVariant SequenceBlockModel::data(const QModelIndex& index, int role) const {
  if (!IsCellOf(*this, index)) return {};
  const Row& row = mRows[static_cast<std::size_t>(index.row())];
  const bool missing = mMissing && !NamedSegment(index).empty() && mMissing(NamedSegment(index));
  switch (role) {
    case Qt::DisplayRole:
    case Qt::EditRole:
      return row.cells[index.column()];
    case Qt::TextAlignmentRole:
      return index.column() == static_cast<int>(SequenceBlockTable::kLength)
                 ? QVariant(Qt::Alignment(Qt::AlignRight | Qt::AlignVCenter))
                 : QVariant();
    case Qt::ForegroundRole:
      return missing ? QVariant(QBrush(Qt::red)) : QVariant();
    case Qt::ToolTipRole:
      return missing ? QVariant(QStringLiteral("The instrument has no segment of this name.")) : QVariant();
    default:
      return {};
  }
}

QVariant SequenceBlockModel::headerData(int section, Qt::Orientation orientation, int role) const {
  if (orientation == Qt::Vertical) return QAbstractTableModel::headerData(section, orientation, role);
  if (section < 0 || section >= mColumns) return {};
  const auto column = static_cast<unsigned long>(section);
  if (column < SequenceBlockTable::kFirstPort) {
    return role == Qt::DisplayRole ? QVariant(QString::fromStdString(SequenceBlockTable::Heading(column))) : QVariant();
  }
  QString tip;
  const QString text = PortHeader(SequenceBlockTable::PortOf(column), &tip);
  return role == Qt::DisplayRole ? QVariant(text) : role == Qt::ToolTipRole ? QVariant(tip) : QVariant();
}

Qt::ItemFlags SequenceBlockModel::flags(const QModelIndex& index) const {
  if (!IsCellOf(*this, index)) return Qt::NoItemFlags;
  const Qt::ItemFlags shown = Qt::ItemIsSelectable | Qt::ItemIsEnabled;
  return mTable.IsEditable(InstrumentHeld()) ? shown | Qt::ItemIsEditable : shown;
}

// What the instrument took reaches the rows through the reports of the read that follows the
// write; a refusal leaves them as they were.
bool SequenceBlockModel::setData(const QModelIndex& index, const QVariant& value, int role) {
  if (role != Qt::EditRole || !(flags(index) & Qt::ItemIsEditable)) return false;
  const auto block = static_cast<unsigned long>(index.row()) + 1;
  const auto column = static_cast<unsigned long>(index.column());
  const Dstring text = value.toString().toStdString();
  return mRunner([&](ConditionList& list) { return mTable.Write(block, column, text, list); }) == 0;
}

void SequenceBlockModel::TakeCell(unsigned long block, unsigned long column) {
  if (block < 1 || block > mRows.size() || column >= static_cast<unsigned long>(mColumns)) return;
  Row& row = mRows[block - 1];
  row.cells[static_cast<int>(column)] = QString::fromStdString(mTable.Text(block, column));
  if (column >= SequenceBlockTable::kFirstPort) row.named[column - SequenceBlockTable::kFirstPort] = mTable.NamedSegment(block, column);
  const QModelIndex cell = index(static_cast<int>(block) - 1, static_cast<int>(column));
  emit dataChanged(cell, cell);
}

int SequenceBlockModel::NfyBlockInserted(unsigned long block, ConditionList&) {
  if (block < 1 || block > mRows.size() + 1) {
    Reload();
    return 0;
  }
  const int row = static_cast<int>(block) - 1;
  beginInsertRows({}, row, row);
  mRows.insert(mRows.begin() + row, ReadRow(block));
  endInsertRows();
  return 0;
}

int SequenceBlockModel::NfyBlockDeleted(unsigned long block, ConditionList&) {
  if (block < 1 || block > mRows.size()) {
    Reload();
    return 0;
  }
  const int row = static_cast<int>(block) - 1;
  beginRemoveRows({}, row, row);
  mRows.erase(mRows.begin() + row);
  endRemoveRows();
  return 0;
}

int SequenceBlockModel::NfyBlockLabelChanged(unsigned long block, ConditionList&) {
  TakeCell(block, SequenceBlockTable::kLabel);
  return 0;
}

int SequenceBlockModel::NfyBlockLengthChanged(unsigned long block, ConditionList&) {
  TakeCell(block, SequenceBlockTable::kLength);
  return 0;
}

int SequenceBlockModel::NfySegmentChanged(unsigned long block, unsigned long port, ConditionList&) {
  TakeCell(block, SequenceBlockTable::kFirstPort + port - 1);
  return 0;
}

int SequenceBlockModel::NfySequence(ConditionList&) {
  Reload();
  return 0;
}
