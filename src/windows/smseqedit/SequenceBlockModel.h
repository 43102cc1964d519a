#pragma once

#include <QAbstractTableModel>
#include <QStringList>
#include <functional>
#include <vector>

#include "sequences/CSequenceObserver.h"
#include "sequences/SequenceBlockTable.h"
#include "windows/common/TableEdit.h"

// The simple sequence editor's blocks as a table model over the sequence (SequenceBlockTable
// says what a cell shows and writes). It follows the model's reports as they come: a block
// inserted or deleted is a row inserted or removed, a changed label, length or segment one
// cell changed, and a whole new sequence (other ports, a forced read) a reset. The rows are
// kept as last told, so that a view reading between two reports of one read sees the rows it
// was told of. A typed cell goes through the runner; while another client holds the
// instrument, or the sequence has loops, no cell takes an edit.
class SequenceBlockModel : public QAbstractTableModel, public CSequenceObserver {
  Q_OBJECT

 public:
  // `missing` tells whether the instrument lacks a segment of that name.
  SequenceBlockModel(CSequence& sequence, std::function<bool(const Dstring&)> missing, QObject* parent = nullptr);
  ~SequenceBlockModel() override;

  const SequenceBlockTable& Table() const { return mTable; }
  void SetRunner(TableEditRunner runner) { mRunner = std::move(runner); }
  // The segment the cell names; empty for a word or another column.
  Dstring NamedSegment(const QModelIndex& index) const;
  // Takes the whole sequence again.
  void Reload();
  // The instrument's segments changed: the ports' marks are drawn again.
  void MissingChanged();

  int rowCount(const QModelIndex& parent = {}) const override;
  int columnCount(const QModelIndex& parent = {}) const override;
  QVariant data(const QModelIndex& index, int role = Qt::DisplayRole) const override;
  QVariant headerData(int section, Qt::Orientation orientation, int role = Qt::DisplayRole) const override;
  Qt::ItemFlags flags(const QModelIndex& index) const override;
  bool setData(const QModelIndex& index, const QVariant& value, int role = Qt::EditRole) override;

  int NfyBlockInserted(unsigned long block, ConditionList& cond) override;
  int NfyBlockDeleted(unsigned long block, ConditionList& cond) override;
  int NfyBlockLabelChanged(unsigned long block, ConditionList& cond) override;
  int NfyBlockLengthChanged(unsigned long block, ConditionList& cond) override;
  int NfySegmentChanged(unsigned long block, unsigned long port, ConditionList& cond) override;
  int NfySequence(ConditionList& cond) override;

 private:
  struct Row {
    QStringList cells;
    std::vector<Dstring> named;  // per port: the segment named, empty for a word
  };
  Row ReadRow(unsigned long block) const;
  // Takes one cell of the block again and says so.
  void TakeCell(unsigned long block, unsigned long column);

  SequenceBlockTable mTable;
  std::function<bool(const Dstring&)> mMissing;
  TableEditRunner mRunner = ReportedEdit;
  int mColumns = 0;
  std::vector<Row> mRows;
};
