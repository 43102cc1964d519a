#pragma once

#include <vector>

#include "data/ErrStateGridModel.h"
#include "segments/ui/GridManager.h"

// The error state grid on screen, over an ErrStateGridModel: a line per analyser port with its
// name and error count ("names" and "totals", both NameDisp columns) and a DigitDisp cell per
// channel with that channel's errors, in the alert colour once it has any. The arrow keys, Home,
// End and the page keys move the model's cursor.
class ErrStateGridManager : public GridManager {
  Q_OBJECT

 public:
  explicit ErrStateGridManager(QWidget* parent = nullptr);

  // Offers "ErrStateGridManager" to the resource loader.
  static void CppRegister();
  static const char* Class() { return "ErrStateGridManager"; }

  // Shows these counts; the cursor keeps its port and channel where they still exist.
  void SetResults(const std::vector<BerSvr::PortResult>& results);
  const std::vector<BerSvr::PortResult>& GetResults() const { return mModel.GetResults(); }
  long CursorLine() const { return mModel.CursorLine(); }
  long CursorChannel() const { return mModel.CursorChannel(); }
  void SetCursor(long line, long channel);
  // What the cursor is on, in words: "Group 1 › Module 3 › Port 1, channel 5: 1 234 errors".
  QString CursorText() const;
  // The text of a count in a cell: whole up to 9,999, then to three figures with k, M, G, T.
  static QString CountText(unsigned long long count);

  void GetNumDigits(long row, long& count) override;
  void GetDigitOffset(long row, long& value) override;
  int SetDigitOffset(long row, long first, ConditionList& list) override;
  int GetIsErrorInVector(long row) override;

  long DispLineCount() const override;
  long DispFirstLine() const override { return mFirst; }
  void DispScrollTo(long firstLine) override { mFirst = firstLine; }
  QString DispHeader(const GridDisp& disp, int cell) const override;
  GridCell DispCell(const GridDisp& disp, long line, int cell) const override;
  void DispPress(const GridDisp& disp, long line, int cell, Qt::KeyboardModifiers modifiers) override;

 protected:
  void keyPressEvent(QKeyEvent* event) override;

 private:
  // The channel cells the grid's DigitDisp shows.
  long ChannelsShown() const;
  bool IsTotals(const GridDisp& disp) const;
  // Shows the model's cursor and tells the window.
  void Follow();

  ErrStateGridModel mModel;
  long mFirst = 0;
};
