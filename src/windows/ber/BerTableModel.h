#pragma once

#include <QAbstractTableModel>
#include <vector>

#include "data/BerSvr.h"

// The error rate service's counts as a table model: a row per analyser port with its name, its
// compared bits, its errors (red once there are any) and its ratio, in the forms of the status
// bar. New counts of the same ports change only the rows whose counts changed; other ports are
// a reset.
class BerTableModel : public QAbstractTableModel {
  Q_OBJECT

 public:
  enum Column { kPort = 0, kCompared = 1, kErrors = 2, kRatio = 3, kColumns = 4 };

  explicit BerTableModel(QObject* parent = nullptr) : QAbstractTableModel(parent) {}

  void SetResults(const std::vector<BerSvr::PortResult>& results);
  const std::vector<BerSvr::PortResult>& Results() const { return mResults; }

  int rowCount(const QModelIndex& parent = {}) const override;
  int columnCount(const QModelIndex& parent = {}) const override;
  QVariant data(const QModelIndex& index, int role = Qt::DisplayRole) const override;
  QVariant headerData(int section, Qt::Orientation orientation, int role = Qt::DisplayRole) const override;

 private:
  std::vector<BerSvr::PortResult> mResults;
};
