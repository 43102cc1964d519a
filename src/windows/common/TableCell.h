#pragma once

#include <QAbstractItemModel>

// Whether `index` is a cell of the table `model`: views and testers also ask about the invalid
// index and about cells of rows just removed.
inline bool IsCellOf(const QAbstractItemModel& model, const QModelIndex& index) {
  return index.isValid() && index.model() == &model && index.row() < model.rowCount() &&
         index.column() < model.columnCount();
}
