#pragma once

#include <QAbstractTableModel>
#include <QModelIndexList>
#include <cstddef>

// The session's error journal as a table model, newest first: time, code, text and command.
// While it lives it is the journal's listener: an entry added is a row inserted at the top (and
// the oldest row removed when the journal is full), a clear a reset.
class ErrorJournalModel : public QAbstractTableModel {
  Q_OBJECT

 public:
  enum Column { kTime = 0, kCode = 1, kText = 2, kCommand = 3, kColumns = 4 };

  explicit ErrorJournalModel(QObject* parent = nullptr);
  ~ErrorJournalModel() override;

  // The rows as tab-separated lines, top first; `rows` empty means all.
  QString RowsAsText(QModelIndexList rows) const;

  int rowCount(const QModelIndex& parent = {}) const override;
  int columnCount(const QModelIndex& parent = {}) const override;
  QVariant data(const QModelIndex& index, int role = Qt::DisplayRole) const override;
  QVariant headerData(int section, Qt::Orientation orientation, int role = Qt::DisplayRole) const override;

 private:
  // Told after every change of the journal: one entry added, or the journal cleared.
  void Follow();

  int mRows = 0;
  // Entries at the top of the journal that the rows do not have yet.
  std::size_t mUnseen = 0;
};
