#pragma once

#include <QWidget>
#include <functional>
#include <vector>

#include "segments/SegmentProperties.h"
#include "support/ConditionList.h"

class QAction;
class QComboBox;
class QLabel;
class QLineEdit;
class QListWidget;
class SegmentGridManager;

// The segment editor ("dataedit.SegmentEditWin"): the saved segments of the instrument on the
// left (open one by choosing it, make a new one, delete one), and the segment grid of the open
// one with its menus: the editing commands, each offered only while the grid says it is
// possible, find, go to, the error vectors, save and save as. Refusals are shown in the error
// dialog; what only concerns typing (a digit the format does not know) in the line below the grid.
class DataeditSegmentEditWin : public QWidget {
  Q_OBJECT

 public:
  explicit DataeditSegmentEditWin(QWidget* parent = nullptr);
  ~DataeditSegmentEditWin() override;

  int Load(ConditionList& list);
  SegmentGridManager* Grid() const { return mGrid; }
  QListWidget* SegmentList() const { return mSegments; }
  QAction* Action(const QString& name) const;
  QString MessageText() const;
  // Reads the saved segments again and selects `current` when it is among them.
  int ReadCatalog(ConditionList& list);
  // Opens the named segment in the grid; the one open before is let go first.
  int OpenSegment(const Dstring& name, ConditionList& list);
  // Opens the named segment as the user asks for it: unsaved changes of the one open are
  // saved, let go or kept (then nothing opens), and the list marks what is open.
  int ShowSegment(const Dstring& name, ConditionList& list);
  // Makes a segment of these properties and opens it.
  int CreateSegment(const SegmentProperties& properties, ConditionList& list);
  int DeleteSegment(const Dstring& name, ConditionList& list);

 protected:
  // Edits not saved are saved, let go, or the window stays, as the user answers.
  void closeEvent(QCloseEvent* event) override;

 private:
  struct Command;
  enum class File { kImportText, kExportText, kExportVcd };

  void BuildMenus();
  // False when the user keeps the segment open; `doing` ends the question ("closing").
  bool ConfirmLeave(const char* doing);
  // Makes the open segment the list's current line, or none.
  void MarkOpen();
  // Enables every command as the grid says, and puts the name and dirty mark in the title.
  void ShowState();
  // Runs a grid operation and shows what it refused.
  void Run(const std::function<int(ConditionList&)>& operation);
  void HitPButNew();
  void HitPButDelete();
  void HitSegmentChosen();
  void HitSaveAs();
  void HitFile(File what);
  void HitInsert(VectorTrace what);
  void HitDeserialize();
  void HitCoding();
  // The codings a segment can have, as the server spells them.
  static QStringList Codings();
  void HitGoto();

  SegmentGridManager* mGrid = nullptr;
  QListWidget* mSegments = nullptr;
  QComboBox* mFormat = nullptr;
  QComboBox* mAddr = nullptr;
  QLineEdit* mFind = nullptr;
  QLineEdit* mGoto = nullptr;
  QLabel* mCursor = nullptr;
  QLabel* mMessage = nullptr;
  std::vector<std::pair<QAction*, std::function<bool()>>> mOffered;
};
