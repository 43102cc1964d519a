#pragma once

#include <QWidget>
#include <functional>
#include <memory>
#include <vector>

#include "segments/SegmentProperties.h"
#include "support/ConditionList.h"

class QAction;
class QComboBox;
class QLabel;
class QLineEdit;
class QListWidget;
class SegmentCatalogFollower;
class SegmentGridManager;

namespace Ui {
class SegmentEditWin;
}

// The segment editor ("dataedit.SegmentEditWin"): the saved segments of the instrument on the
// left (open one by choosing it, make a new one, delete one), and the segment grid of the open
// one with its menus: the editing commands, each offered only while the grid says it is
// possible, find, go to, the error vectors, save and save as. Refusals are shown in the error
// dialog; what only concerns typing (a digit the format does not know) in the line below the grid.
//
// The list follows the instrument's catalogue within a poll. A segment another client changed
// under digits typed here is not written over without a word: the window asks whether to keep
// the digits, take the other client's version, or look at both first. A segment the sequence
// plays is deleted only after a warning naming its blocks.
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
  // The question to put before `name` is deleted: a warning naming the blocks of the sequence
  // that play it, or the plain question.
  static Dstring DeleteQuestion(const Dstring& name);

  // What the user chose when another client changed the segment under digits typed here.
  enum class Choice { kKeepMine, kTakeTheirs, kLookFirst, kLater };
  // Asks, unless the segment is no longer changed elsewhere, and does what was chosen; "look
  // first" shows the held vectors as they were, as typed and as the other client left them,
  // and asks again. Later keeps everything as it is: the Segment menu offers the choice.
  void AskChangedElsewhere();
  // The table of differences shown by "look first".
  QString DifferencesText() const;

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
  // Fills the list from the catalogue and marks the open segment.
  void FillList();
  Choice AskChoice();
  Choice AskAfterLooking();
  void Choose(Choice choice);

  SegmentGridManager* mGrid = nullptr;
  QListWidget* mSegments = nullptr;
  QComboBox* mFormat = nullptr;
  QComboBox* mAddr = nullptr;
  QLineEdit* mFind = nullptr;
  QLineEdit* mGoto = nullptr;
  QLabel* mCursor = nullptr;
  QLabel* mMessage = nullptr;
  std::vector<std::pair<QAction*, std::function<bool()>>> mOffered;
  std::unique_ptr<SegmentCatalogFollower> mCatalog;
  std::unique_ptr<Ui::SegmentEditWin> mUi;
};
