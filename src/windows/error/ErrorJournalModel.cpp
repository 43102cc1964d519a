#include "windows/error/ErrorJournalModel.h"

#include <algorithm>

#include "core/ErrorJournal.h"
#include "windows/common/TableCell.h"

ErrorJournalModel::ErrorJournalModel(QObject* parent) : QAbstractTableModel(parent) {
  mRows = static_cast<int>(ErrorJournal::Entries().size());
  ErrorJournal::SetListener([this] { Follow(); });
}

ErrorJournalModel::~ErrorJournalModel() { ErrorJournal::SetListener(nullptr); }

void ErrorJournalModel::Follow() {
  const std::size_t size = ErrorJournal::Entries().size();
  const auto shown = static_cast<std::size_t>(mRows);
  const bool full = size == shown && size == ErrorJournal::kMaxEntries;
  if (size == 0 || (size != shown + 1 && !full)) {
    beginResetModel();
    mRows = static_cast<int>(size);
    mUnseen = 0;
    endResetModel();
    return;
  }
  // The rows stand one entry lower in the journal until the new one is told.
  mUnseen = 1;
  if (full) {
    beginRemoveRows({}, mRows - 1, mRows - 1);
    --mRows;
    endRemoveRows();
  }
  beginInsertRows({}, 0, 0);
  mUnseen = 0;
  ++mRows;
  endInsertRows();
}

int ErrorJournalModel::rowCount(const QModelIndex& parent) const { return parent.isValid() ? 0 : mRows; }

int ErrorJournalModel::columnCount(const QModelIndex& parent) const { return parent.isValid() ? 0 : kColumns; }

QVariant ErrorJournalModel::data(const QModelIndex& index, int role) const {
  if (!IsCellOf(*this, index)) return {};
  const std::size_t at = static_cast<std::size_t>(index.row()) + mUnseen;
  if (at >= ErrorJournal::Entries().size()) return {};
  const ErrorJournal::Entry& e = ErrorJournal::Entries()[at];
  switch (role) {
    case Qt::DisplayRole:
      switch (index.column()) {
        case kTime:
          return QString::fromStdString(e.time);
        case kCode:
          return QString::number(e.code);
        case kText:
          return QString::fromStdString(e.text);
        default:
          return QString::fromStdString(e.command);
      }
    case Qt::ToolTipRole:
      return index.column() == kText      ? QVariant(QString::fromStdString(e.text))
             : index.column() == kCommand ? QVariant(QString::fromStdString(e.command))
                                          : QVariant();
    default:
      return {};
  }
}

QVariant ErrorJournalModel::headerData(int section, Qt::Orientation orientation, int role) const {
  static const char* const kHeadings[kColumns] = {"Time", "Code", "Message", "Command"};
  if (orientation == Qt::Vertical || role != Qt::DisplayRole || section < 0 || section >= kColumns)
    return QAbstractTableModel::headerData(section, orientation, role);
  return QString::fromLatin1(kHeadings[section]);
}

QString ErrorJournalModel::RowsAsText(QModelIndexList rows) const {
  if (rows.isEmpty()) {
    for (int r = 0; r < mRows; ++r) rows << index(r, 0);
  }
  std::sort(rows.begin(), rows.end(), [](const QModelIndex& a, const QModelIndex& b) { return a.row() < b.row(); });
  QStringList lines;
  for (const QModelIndex& row : rows) {
    QStringList cells;
    for (int c = 0; c < kColumns; ++c) cells << index(row.row(), c).data().toString();
    lines << cells.join(QLatin1Char('\t'));
  }
  return lines.join(QLatin1Char('\n'));
}
