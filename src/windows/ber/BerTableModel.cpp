#include "windows/ber/BerTableModel.h"

#include <QColor>

#include "support/NumberText.h"
#include "windows/common/PlaceName.h"
#include "windows/common/TableCell.h"

void BerTableModel::SetResults(const std::vector<BerSvr::PortResult>& results) {
  const bool samePorts = results.size() == mResults.size() &&
                         std::equal(results.begin(), results.end(), mResults.begin(),
                                    [](const BerSvr::PortResult& a, const BerSvr::PortResult& b) { return a.port == b.port; });
  if (!samePorts) {
    beginResetModel();
    mResults = results;
    endResetModel();
    return;
  }
  for (std::size_t row = 0; row < results.size(); ++row) {
    if (results[row] == mResults[row]) continue;
    mResults[row] = results[row];
    emit dataChanged(index(static_cast<int>(row), kCompared), index(static_cast<int>(row), kRatio));
  }
}

int BerTableModel::rowCount(const QModelIndex& parent) const {
  return parent.isValid() ? 0 : static_cast<int>(mResults.size());
}

int BerTableModel::columnCount(const QModelIndex& parent) const { return parent.isValid() ? 0 : kColumns; }

QVariant BerTableModel::data(const QModelIndex& index, int role) const {
  if (!IsCellOf(*this, index)) return {};
  const BerSvr::PortResult& r = mResults[static_cast<std::size_t>(index.row())];
  switch (role) {
    case Qt::DisplayRole:
      switch (index.column()) {
        case kPort:
          return PlaceName(r.port);
        case kCompared:
          return QString::fromStdString(NumberText::Grouped(r.compared));
        case kErrors:
          return QString::fromStdString(NumberText::Grouped(r.errors));
        default:
          return QString::fromStdString(NumberText::Ratio(r.errors, r.compared));
      }
    case Qt::TextAlignmentRole:
      return index.column() == kPort ? QVariant() : QVariant(Qt::Alignment(Qt::AlignRight | Qt::AlignVCenter));
    case Qt::ForegroundRole:
      return index.column() == kErrors && r.errors > 0 ? QVariant(QColor(0xb3, 0x26, 0x1e)) : QVariant();
    default:
      return {};
  }
}

QVariant BerTableModel::headerData(int section, Qt::Orientation orientation, int role) const {
  static const char* const kHeadings[kColumns] = {"Analyser port", "Compared bits", "Errors", "Bit error rate"};
  if (orientation == Qt::Vertical || role != Qt::DisplayRole || section < 0 || section >= kColumns)
    return QAbstractTableModel::headerData(section, orientation, role);
  return QString::fromLatin1(kHeadings[section]);
}
