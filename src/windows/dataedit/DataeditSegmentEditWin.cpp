#include "windows/dataedit/DataeditSegmentEditWin.h"

#include <QAction>
#include <QCloseEvent>
#include <QComboBox>
#include <QDialog>
#include <QDialogButtonBox>
#include <QFileDialog>
#include <QFontDatabase>
#include <QInputDialog>
#include <QLabel>
#include <QLayout>
#include <QLineEdit>
#include <QListWidget>
#include <QMdiSubWindow>
#include <QMenuBar>
#include <QMessageBox>
#include <QPlainTextEdit>
#include <QProgressDialog>
#include <QPushButton>
#include <QSpinBox>
#include <QTimer>
#include <QVBoxLayout>

#include "instrument/CallProgressScope.h"
#include "instrument/QenStatus.h"
#include "params/ui/BoundControl.h"
#include "segments/QenSegmentDs.h"
#include "segments/QenSegmentPool.h"
#include "segments/SegmentCatalogFollower.h"
#include "segments/SegmentTextFile.h"
#include "segments/ui/SegmentGridManager.h"
#include "sequences/CSequence.h"
#include "sequences/SequenceSegmentUse.h"
#include "sequences/SequenceService.h"
#include "support/ConditionListLoader.h"
#include "support/FWBlocker.h"
#include "toolkit/Toolkit.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "windows/common/FormDialog.h"
#include "windows/common/ServerWorkProgress.h"
#include "ui_dataedit.SegmentEditWin.h"

// A menu entry: its text and key, what it does, and when it is offered.
struct DataeditSegmentEditWin::Command {
  const char* menu;
  const char* name;
  const char* text;
  QKeySequence key;
  std::function<int(SegmentGridManager&, ConditionList&)> run;
  std::function<bool(SegmentGridManager&)> possible;
};

DataeditSegmentEditWin::DataeditSegmentEditWin(QWidget* parent) : QWidget(parent), mUi(std::make_unique<Ui::SegmentEditWin>()) {
  setObjectName(QStringLiteral("DataeditSegmentEditWin"));
}

// The grid goes after this window's part of the object: what it says while it lets go of the
// segment must not reach this window any more.
DataeditSegmentEditWin::~DataeditSegmentEditWin() {
  if (mGrid != nullptr) disconnect(mGrid, nullptr, this, nullptr);
}

int DataeditSegmentEditWin::Load(ConditionList& list) {
  mUi->setupUi(this);
  ResourceLibrary::InitWidgets(this);
  mGrid = mUi->GridSegment;
  mSegments = mUi->ListSegments;
  mFormat = mUi->CBoxFormat;
  mAddr = mUi->CBoxAddr;
  mFind = mUi->EditFind;
  mGoto = mUi->EditGoto;
  mCursor = mUi->LabelCursor;
  mMessage = mUi->LabelMessage;
  mMessage->setStyleSheet(QStringLiteral("color: #b3261e"));
  BuildMenus();
  connect(mGrid, &GridManager::StateChanged, this, &DataeditSegmentEditWin::ShowState);
  connect(mGrid, &SegmentGridManager::Message, mMessage, &QLabel::setText);
  // The question waits for the poll that brought the change to end.
  connect(mGrid, &SegmentGridManager::ChangedElsewhere, this,
          [this] { QTimer::singleShot(0, this, &DataeditSegmentEditWin::AskChangedElsewhere); });
  connect(mSegments, &QListWidget::itemActivated, this, &DataeditSegmentEditWin::HitSegmentChosen);
  // Arrow keys in the list open what they land on, as a click does.
  connect(mSegments, &QListWidget::currentItemChanged, this, &DataeditSegmentEditWin::HitSegmentChosen);
  connect(mUi->PButNew, &QPushButton::clicked, this, &DataeditSegmentEditWin::HitPButNew);
  connect(mUi->PButDelete, &QPushButton::clicked, this, &DataeditSegmentEditWin::HitPButDelete);
  connect(mFormat, &QComboBox::currentIndexChanged, this, [this](int index) {
    Run([this, index](ConditionList& l) { return mGrid->SetDataFormat(0, static_cast<DataFormat>(index), l); });
  });
  connect(mAddr, &QComboBox::currentIndexChanged, this, [this](int index) {
    Run([this, index](ConditionList& l) { return mGrid->SetAddrFormat(static_cast<AddrFormat>(index), l); });
  });
  connect(mFind, &QLineEdit::textChanged, this, [this](const QString& text) {
    mGrid->SetFindText(text.trimmed().toStdString());
    ShowState();
  });
  connect(mFind, &QLineEdit::returnPressed, Action(QStringLiteral("FindNext")), &QAction::trigger);
  connect(mUi->PButFindNext, &QPushButton::clicked, Action(QStringLiteral("FindNext")), &QAction::trigger);
  connect(mUi->PButFindPrev, &QPushButton::clicked, Action(QStringLiteral("FindPrevious")), &QAction::trigger);
  connect(mGoto, &QLineEdit::returnPressed, this, &DataeditSegmentEditWin::HitGoto);
  setFocusProxy(mGrid);
  mCatalog = std::make_unique<SegmentCatalogFollower>([this] { FillList(); });
  const int status = ReadCatalog(list);
  ShowState();
  return status;
}

void DataeditSegmentEditWin::BuildMenus() {
  using G = SegmentGridManager;
  const auto editable = [](G& g) { return g.IsFillPossible(); };
  const auto elsewhere = [](G& g) {
    return g.GetSegmentDs() != nullptr && g.GetSegmentDs()->IsChangedElsewhere();
  };
  const Command commands[] = {
      {"&Segment", "Save", "&Save", QKeySequence::Save,
       [](G& g, ConditionList& l) { return g.SaveSegment(0, 0, l); }, [](G& g) { return g.IsDirty(); }},
      {"&Segment", "SaveAs", "Save &As…", QKeySequence(), nullptr,
       [](G& g) { return g.GetSegmentDs() != nullptr; }},
      {"&Segment", "ImportText", "&Import Text…", QKeySequence(), nullptr,
       [](G& g) { return g.GetSegmentDs() != nullptr; }},
      {"&Segment", "ExportText", "&Export Text…", QKeySequence(), nullptr, editable},
      {"&Segment", "ExportVcd", "Export &VCD…", QKeySequence(), nullptr, editable},
      {"&Segment", "KeepMine", "&Keep My Digits", QKeySequence(),
       [](G& g, ConditionList& l) { return g.GetSegmentDs()->KeepMine(l); }, elsewhere},
      {"&Segment", "TakeTheirs", "&Take Their Version", QKeySequence(),
       [](G& g, ConditionList& l) { return g.GetSegmentDs()->TakeTheirs(l); }, elsewhere},
      {"&Segment", "LookFirst", "&Compare with Their Version…", QKeySequence(), nullptr, elsewhere},
      {"&Edit", "Fill0", "Fill with &0", QKeySequence(Qt::CTRL | Qt::Key_L),
       [](G& g, ConditionList& l) {
         g.SetFillState(0);
         return g.ModifyFill(l);
       },
       editable},
      {"&Edit", "Fill1", "Fill with &1", QKeySequence(Qt::CTRL | Qt::Key_H),
       [](G& g, ConditionList& l) {
         g.SetFillState(1);
         return g.ModifyFill(l);
       },
       editable},
      {"&Edit", "Invert", "&Invert", QKeySequence(Qt::CTRL | Qt::Key_I),
       [](G& g, ConditionList& l) { return g.ModifyInvert(l); }, [](G& g) { return g.IsInvertPossible(); }},
      {"&Edit", "MirrorTraces", "Mirror &Traces", QKeySequence(),
       [](G& g, ConditionList& l) { return g.ModifyMirror(MirrorMode::kTrace, l); },
       [](G& g) { return g.IsMirrorPossible(); }},
      {"&Edit", "MirrorVectors", "Mirror &Vectors", QKeySequence(),
       [](G& g, ConditionList& l) { return g.ModifyMirror(MirrorMode::kVector, l); },
       [](G& g) { return g.IsMirrorPossible(); }},
      {"&Edit", "Copy", "&Copy", QKeySequence::Copy, [](G& g, ConditionList& l) { return g.ModifyCopy(l); },
       [](G& g) { return g.IsCopyPossible(); }},
      {"&Edit", "Paste", "&Paste", QKeySequence::Paste,
       [](G& g, ConditionList& l) { return g.ModifyPaste(l); }, nullptr},
      {"&Edit", "PasteText", "Paste &Text", QKeySequence(Qt::CTRL | Qt::SHIFT | Qt::Key_V),
       [](G& g, ConditionList& l) { return g.PasteText(l); }, editable},
      {"&Edit", "InsertVectors", "I&nsert Vectors…", QKeySequence(Qt::Key_Insert), nullptr,
       [](G& g) { return g.IsInsertPossible(); }},
      {"&Edit", "DeleteVectors", "&Delete Vectors", QKeySequence(Qt::Key_Delete),
       [](G& g, ConditionList& l) { return g.ModifyDelete(l); }, [](G& g) { return g.IsDeletePossible(); }},
      {"&Edit", "InsertTraces", "Insert T&races…", QKeySequence(), nullptr,
       [](G& g) { return g.IsEditable(); }},
      {"&Edit", "DeleteTraces", "Delete Tr&aces", QKeySequence(),
       [](G& g, ConditionList& l) { return g.DeleteTraces(l); }, [](G& g) { return g.IsEditable(); }},
      {"&Edit", "SerializeLsb", "Serialise, &Lowest Trace First", QKeySequence(),
       [](G& g, ConditionList& l) { return g.ModifySerialize(Direction::kLsbFirst, l); },
       [](G& g) { return g.IsSerializePossible(); }},
      {"&Edit", "SerializeMsb", "Serialise, &Highest Trace First", QKeySequence(),
       [](G& g, ConditionList& l) { return g.ModifySerialize(Direction::kMsbFirst, l); },
       [](G& g) { return g.IsSerializePossible(); }},
      {"&Edit", "Deserialize", "Deseriali&se…", QKeySequence(), nullptr,
       [](G& g) { return g.IsDeserializePossible(); }},
      {"&Edit", "Coding", "C&onvert Coding…", QKeySequence(), nullptr,
       [](G& g) { return g.IsCodingPossible(); }},
      {"&Edit", "SelectAll", "Select &All", QKeySequence::SelectAll,
       [](G& g, ConditionList& l) {
         long vectors = 0, digits = 0;
         g.GetNumVectors(0, vectors);
         g.GetNumDigits(0, digits);
         return g.SetSelection(0, 0, vectors - 1, 0, digits - 1, 0, l);
       },
       editable},
      {"&Go", "FindNext", "Find &Next", QKeySequence(Qt::Key_F3),
       [](G& g, ConditionList& l) { return g.FindPattern(FindDirection::kNext, VectorTrace::kVector, l); },
       [](G& g) { return g.IsFindPossible(); }},
      {"&Go", "FindPrevious", "Find &Previous", QKeySequence(Qt::SHIFT | Qt::Key_F3),
       [](G& g, ConditionList& l) {
         return g.FindPattern(FindDirection::kPrevious, VectorTrace::kVector, l);
       },
       [](G& g) { return g.IsFindPossible(); }},
      {"&Go", "NextError", "Next &Error", QKeySequence(Qt::CTRL | Qt::Key_E),
       [](G& g, ConditionList& l) { return g.MoveToError(ERR_DIR::kNext, l); },
       [](G& g) { return g.CanMoveToError(ERR_DIR::kNext); }},
      {"&Go", "PreviousError", "Pre&vious Error", QKeySequence(Qt::CTRL | Qt::SHIFT | Qt::Key_E),
       [](G& g, ConditionList& l) { return g.MoveToError(ERR_DIR::kPrevious, l); },
       [](G& g) { return g.CanMoveToError(ERR_DIR::kPrevious); }},
      {"&Go", "Goto", "&Go to Vector…", QKeySequence(Qt::CTRL | Qt::Key_G), nullptr,
       [](G& g) { return g.CanShowGoto(); }},
  };
  auto* bar = new QMenuBar(this);
  layout()->setMenuBar(bar);
  QMenu* menu = nullptr;
  for (const Command& c : commands) {
    if (menu == nullptr || menu->title() != QLatin1String(c.menu)) menu = bar->addMenu(QString::fromUtf8(c.menu));
    QAction* action = menu->addAction(QString::fromUtf8(c.text));
    action->setObjectName(QString::fromLatin1(c.name));
    action->setShortcut(c.key);
    // Keys a text field has too are the grid's alone: in the find field Ctrl+C copies its text,
    // not the segment. The others work anywhere in the window.
    const bool textKey = c.key == QKeySequence(QKeySequence::Copy) || c.key == QKeySequence(QKeySequence::Paste) ||
                         c.key == QKeySequence(QKeySequence::SelectAll) || c.key == QKeySequence(Qt::Key_Delete) ||
                         c.key == QKeySequence(Qt::CTRL | Qt::SHIFT | Qt::Key_V) ||
                         c.key == QKeySequence(Qt::Key_Insert);
    action->setShortcutContext(textKey ? Qt::WidgetShortcut : Qt::WidgetWithChildrenShortcut);
    (textKey ? static_cast<QWidget*>(mGrid) : this)->addAction(action);
    if (c.run) {
      auto run = c.run;
      connect(action, &QAction::triggered, this, [this, run] { Run([this, run](ConditionList& l) { return run(*mGrid, l); }); });
    }
    if (c.possible) {
      auto possible = c.possible;
      mOffered.emplace_back(action, [this, possible] { return possible(*mGrid); });
    }
  }
  connect(Action(QStringLiteral("SaveAs")), &QAction::triggered, this, &DataeditSegmentEditWin::HitSaveAs);
  connect(Action(QStringLiteral("ImportText")), &QAction::triggered, this, [this] { HitFile(File::kImportText); });
  connect(Action(QStringLiteral("ExportText")), &QAction::triggered, this, [this] { HitFile(File::kExportText); });
  connect(Action(QStringLiteral("ExportVcd")), &QAction::triggered, this, [this] { HitFile(File::kExportVcd); });
  connect(Action(QStringLiteral("InsertVectors")), &QAction::triggered, this, [this] { HitInsert(VectorTrace::kVector); });
  connect(Action(QStringLiteral("InsertTraces")), &QAction::triggered, this, [this] { HitInsert(VectorTrace::kTrace); });
  connect(Action(QStringLiteral("Deserialize")), &QAction::triggered, this, &DataeditSegmentEditWin::HitDeserialize);
  connect(Action(QStringLiteral("LookFirst")), &QAction::triggered, this,
          [this] { Choose(AskAfterLooking()); });
  connect(Action(QStringLiteral("Coding")), &QAction::triggered, this, &DataeditSegmentEditWin::HitCoding);
  connect(Action(QStringLiteral("Goto")), &QAction::triggered, this, [this] {
    mGoto->setFocus();
    mGoto->selectAll();
  });
  // Whether the server's clipboard fits is asked only when the menu opens.
  for (QMenu* m : bar->findChildren<QMenu*>()) {
    connect(m, &QMenu::aboutToShow, this, [this] { Action(QStringLiteral("Paste"))->setEnabled(mGrid->IsPastePossible()); });
  }
}

QAction* DataeditSegmentEditWin::Action(const QString& name) const { return findChild<QAction*>(name); }

QString DataeditSegmentEditWin::MessageText() const { return mMessage->text(); }

void DataeditSegmentEditWin::ShowState() {
  for (const auto& [action, possible] : mOffered) action->setEnabled(possible());
  Action(QStringLiteral("Paste"))->setEnabled(mGrid->IsEditable());
  mCursor->setText(mGrid->CursorText());
  Dstring name;
  ConditionList ignored;
  mGrid->GetSegmentName(0, 0, name, ignored);
  const QString title = name.empty() ? QStringLiteral("Segment Editor")
                                     : QStringLiteral("Segment Editor – %1%2").arg(QString::fromStdString(name),
                                                                                  mGrid->IsDirty() ? QStringLiteral(" *") : QString());
  setWindowTitle(title);
  if (auto* sub = qobject_cast<QMdiSubWindow*>(parentWidget())) sub->setWindowTitle(title);
}

void DataeditSegmentEditWin::Run(const std::function<int(ConditionList&)>& operation) {
  ConditionList list;
  mMessage->clear();
  // The server may take a while over a long segment: the pointer says so meanwhile, and
  // after half a second a dialog shows how far it is and can cancel the work.
  Toolkit::Get().SetWaitCursor(true);
  ServerWorkProgress progress(this, QStringLiteral("The instrument is working on the segment…"));
  int status = 0;
  {
    const CallProgressScope following(&progress);
    status = operation(list);
  }
  Toolkit::Get().SetWaitCursor(false);
  // A lock is a state, not an error: it adds no condition, so it is said here; so is a
  // cancel the user asked for.
  if (status == FWBlocker::kLocked) mMessage->setText(SegmentGridManager::LockedText());
  if (progress.WasCancelled()) {
    ConditionList rest;
    for (const Condition& c : list) {
      if (c.GetCode() != QenStatus::kCancelledError) rest.Add(c);
    }
    if (rest.Size() < list.Size()) {
      list = rest;
      mMessage->setText(QStringLiteral("Cancelled: the instrument left the segment as it was."));
    }
  }
  ShowState();
  BoundControl::Report(list);
}

int DataeditSegmentEditWin::ReadCatalog(ConditionList& list) {
  const int status = mCatalog->Read(list);
  FillList();
  return status;
}

void DataeditSegmentEditWin::FillList() {
  {
    const QSignalBlocker quiet(mSegments);
    mSegments->clear();
    for (const Dstring& name : mCatalog->GetNames())
      new QListWidgetItem(QString::fromStdString(name), mSegments);
  }
  MarkOpen();
}

void DataeditSegmentEditWin::MarkOpen() {
  Dstring open;
  ConditionList ignored;
  mGrid->GetSegmentName(0, 0, open, ignored);
  const QSignalBlocker quiet(mSegments);
  const QList<QListWidgetItem*> shown = mSegments->findItems(QString::fromStdString(open), Qt::MatchExactly);
  mSegments->setCurrentItem(shown.isEmpty() ? nullptr : shown.front());
}

int DataeditSegmentEditWin::OpenSegment(const Dstring& name, ConditionList& list) {
  mMessage->clear();
  const int status = mGrid->HookOn(0, 0, name, list);
  ShowState();
  return status;
}

int DataeditSegmentEditWin::CreateSegment(const SegmentProperties& properties, ConditionList& list) {
  unsigned created = 0;
  if (int status = QenSegmentPool::Create(properties, created, list)) return status;
  const int status = OpenSegment(properties.name, list);
  // The list gains the new segment and marks it open.
  ReadCatalog(list);
  return status;
}

Dstring DataeditSegmentEditWin::DeleteQuestion(const Dstring& name) {
  CSequence* sequence = SequenceService::GetSequence();
  std::vector<unsigned long> blocks;
  if (sequence != nullptr) {
    // The sequence as the instrument holds it now; under a lock, as last read.
    ConditionList ignored;
    sequence->ReadSequence(ignored, 0);
    blocks = SequenceSegmentUse::BlocksNaming(*sequence, name);
  }
  if (blocks.empty()) return Dstring::Format("Delete the segment \"%s\" from the instrument?", name.c_str());
  const Dstring where = SequenceSegmentUse::BlocksText(blocks);
  return Dstring::Format(
      "The sequence plays the segment \"%s\" in %s. Once it is deleted, Run is refused until %s another "
      "segment.\n\nDelete \"%s\" anyway?",
      name.c_str(), where.c_str(), blocks.size() == 1 ? "that block plays" : "those blocks play",
      name.c_str());
}

int DataeditSegmentEditWin::DeleteSegment(const Dstring& name, ConditionList& list) {
  Dstring open;
  mGrid->GetSegmentName(0, 0, open, list);
  if (open == name) {
    if (int status = mGrid->Release(list)) return status;
  }
  const int status = QenSegmentPool::Delete(name, list);
  ReadCatalog(list);
  ShowState();
  return status;
}

// The instrument forgets a segment's unsaved changes when it is closed: before the editor lets
// go of one, the user saves them, lets them go, or stays.
bool DataeditSegmentEditWin::ConfirmLeave(const char* doing) {
  // Digits held back from another client's change are settled first.
  AskChangedElsewhere();
  if (mGrid->GetSegmentDs() != nullptr && mGrid->GetSegmentDs()->IsChangedElsewhere()) return false;
  if (!mGrid->IsDirty()) return true;
  Dstring name;
  ConditionList ignored;
  mGrid->GetSegmentName(0, 0, name, ignored);
  const int answer = Toolkit::Get().AskYesNoCancel(
      Dstring::Format("The segment \"%s\" has changes that are not saved. Save them before %s?", name.c_str(), doing));
  if (answer == ToolkitPort::kCancel) return false;
  if (answer == ToolkitPort::kYes) Run([this](ConditionList& l) { return mGrid->SaveSegment(0, 0, l); });
  return answer == ToolkitPort::kNo || !mGrid->IsDirty();
}

void DataeditSegmentEditWin::closeEvent(QCloseEvent* event) {
  if (!ConfirmLeave("closing")) return event->ignore();
  QWidget::closeEvent(event);
}

// A name the instrument no longer has (deleted by another client, or named by a sequence) opens
// nothing: opening it would make a new, empty segment of that name.
int DataeditSegmentEditWin::ShowSegment(const Dstring& name, ConditionList& list) {
  Dstring open;
  mGrid->GetSegmentName(0, 0, open, list);
  int status = 0;
  bool available = true;
  if (open != name) status = QenSegmentPool::IsAvailable(name, available, list);
  if (status == 0 && !available) {
    ConditionListLoader::ConditionToken(list, "GUI_SEGMENTDS_NOT_ON_INSTRUMENT", {name}, 1);
    status = 1;
    ReadCatalog(list);
  }
  if (status == 0 && open != name && ConfirmLeave("opening another")) status = OpenSegment(name, list);
  // The list marks the segment open now, whichever it is.
  MarkOpen();
  return status;
}

void DataeditSegmentEditWin::HitSegmentChosen() {
  QListWidgetItem* item = mSegments->currentItem();
  if (item == nullptr) return;
  ConditionList list;
  ShowSegment(item->text().toStdString(), list);
  BoundControl::Report(list);
}

void DataeditSegmentEditWin::HitPButNew() {
  FormDialog dialog(this, QStringLiteral("New Segment"));
  auto* name = dialog.Add(QStringLiteral("&Name"), new QLineEdit);
  auto* length = dialog.Add(QStringLiteral("&Vectors"), new QSpinBox);
  length->setRange(1, 1 << 30);
  length->setValue(1024);
  auto* width = dialog.Add(QStringLiteral("&Traces"), new QSpinBox);
  width->setRange(1, 4096);
  width->setValue(16);
  auto* coding = dialog.Add(QStringLiteral("&Coding"), new QComboBox);
  coding->addItems(Codings());
  if (!dialog.Ask() || name->text().trimmed().isEmpty() || !ConfirmLeave("opening the new one")) return;
  SegmentProperties properties;
  properties.name = name->text().trimmed().toStdString();
  properties.length = length->value();
  properties.width = width->value();
  properties.coding = coding->currentText().toStdString();
  Run([this, &properties](ConditionList& l) { return CreateSegment(properties, l); });
}

void DataeditSegmentEditWin::HitPButDelete() {
  QListWidgetItem* item = mSegments->currentItem();
  if (item == nullptr) return;
  const Dstring name = item->text().toStdString();
  if (Toolkit::Get().AskYesNo(DeleteQuestion(name)) != ToolkitPort::kYes) return;
  Run([this, &name](ConditionList& l) { return DeleteSegment(name, l); });
}

void DataeditSegmentEditWin::HitSaveAs() {
  bool ok = false;
  const QString name = QInputDialog::getText(this, QStringLiteral("Save Segment As"), QStringLiteral("&Name"), QLineEdit::Normal, {}, &ok);
  if (!ok || name.trimmed().isEmpty()) return;
  Run([this, &name](ConditionList& l) {
    const int status = mGrid->SaveSegmentAs(0, 0, name.trimmed().toStdString(), l);
    ReadCatalog(l);
    return status;
  });
}

void DataeditSegmentEditWin::HitFile(File what) {
  const QString text = QStringLiteral("Text (*.txt);;All files (*)");
  const QString vcd = QStringLiteral("Value Change Dump (*.vcd);;All files (*)");
  QString path;
  switch (what) {
    case File::kImportText: path = QFileDialog::getOpenFileName(this, QStringLiteral("Import Segment Text"), {}, text); break;
    case File::kExportText: path = QFileDialog::getSaveFileName(this, QStringLiteral("Export Segment Text"), {}, text); break;
    case File::kExportVcd: path = QFileDialog::getSaveFileName(this, QStringLiteral("Export Segment as VCD"), {}, vcd); break;
  }
  if (path.isEmpty()) return;
  const Dstring file = path.toStdString();
  // A long segment takes a while: the progress shows after half a second. An export can be
  // stopped (its file goes); an import cannot, as it would leave the segment half replaced.
  const bool import = what == File::kImportText;
  QProgressDialog progress(import ? QStringLiteral("Importing…") : QStringLiteral("Exporting…"),
                           QStringLiteral("Stop"), 0, 1000, this);
  progress.setWindowModality(Qt::WindowModal);
  progress.setMinimumDuration(500);
  if (import) progress.setCancelButton(nullptr);
  // Only a stop the transfer itself saw counts: it is what ended it.
  bool stopped = false;
  const SegmentTextFile::ProgressScope scope([&progress, &stopped, import](long done, long total) {
    progress.setValue(static_cast<int>(1000 * done / std::max(1L, total)));
    stopped = !import && progress.wasCanceled();
    return !stopped;
  });
  ConditionList list;
  mMessage->clear();
  switch (what) {
    case File::kImportText: mGrid->ImportText(file, list); break;
    case File::kExportText: mGrid->ExportText(file, list); break;
    case File::kExportVcd: mGrid->ExportVcd(file, list); break;
  }
  progress.reset();
  ShowState();
  if (stopped) {
    mMessage->setText(QStringLiteral("The export was stopped; no file was written."));
  } else {
    BoundControl::Report(list);
  }
}

void DataeditSegmentEditWin::HitInsert(VectorTrace what) {
  const bool vectors = what == VectorTrace::kVector;
  bool ok = false;
  const int count = QInputDialog::getInt(this, vectors ? QStringLiteral("Insert Vectors") : QStringLiteral("Insert Traces"),
                                         vectors ? QStringLiteral("&Vectors before the cursor") : QStringLiteral("&Traces below the cursor"),
                                         1, 1, vectors ? 1 << 30 : 4096, 1, &ok);
  if (!ok) return;
  Run([this, what, count](ConditionList& l) { return mGrid->ModifyInsert(what, InsertMode::kBefore, count, l); });
}

void DataeditSegmentEditWin::HitDeserialize() {
  FormDialog dialog(this, QStringLiteral("Deserialise"));
  auto* width = dialog.Add(QStringLiteral("&Traces"), new QSpinBox);
  width->setRange(1, 4096);
  width->setValue(8);
  auto* offset = dialog.Add(QStringLiteral("&From state"), new QSpinBox);
  offset->setRange(0, 1 << 30);
  if (!dialog.Ask()) return;
  Run([this, w = width->value(), o = offset->value()](ConditionList& l) { return mGrid->ModifyDeserialize(w, o, l); });
}

void DataeditSegmentEditWin::HitCoding() {
  bool ok = false;
  const QString coding = QInputDialog::getItem(this, QStringLiteral("Convert Coding"), QStringLiteral("&Coding"), Codings(), 0, false, &ok);
  if (!ok) return;
  mGrid->SetTargetCoding(coding.toStdString());
  Run([this](ConditionList& l) { return mGrid->ModifyCoding(l); });
}

QStringList DataeditSegmentEditWin::Codings() {
  return {QStringLiteral("01"), QStringLiteral("LH"), QStringLiteral("01X"), QStringLiteral("LHX"),
          QStringLiteral("LHXZ01"), QStringLiteral("npkr"), QStringLiteral("npkrX")};
}

void DataeditSegmentEditWin::HitGoto() {
  bool number = false;
  // A number copied from a line of the window comes in groups of digits.
  QString text = mGoto->text();
  text.removeIf([](QChar c) { return c.isSpace(); });
  const long vector = mAddr->currentIndex() == 1 ? text.toLong(&number, 16) : text.toLong(&number, 10);
  if (!number) {
    mMessage->setText(QStringLiteral("\"%1\" is no vector number.").arg(text));
    return;
  }
  Run([this, vector](ConditionList& l) { return mGrid->GoToVectorTrace(vector, mGrid->CursorTrace(), l); });
  mGrid->setFocus();
}

// --- Another client's change under digits typed here ----------------------------------------------

void DataeditSegmentEditWin::AskChangedElsewhere() {
  const QenSegmentDs* ds = mGrid->GetSegmentDs();
  if (ds == nullptr || !ds->IsChangedElsewhere()) return;
  Choice choice = AskChoice();
  if (choice == Choice::kLookFirst) choice = AskAfterLooking();
  Choose(choice);
}

DataeditSegmentEditWin::Choice DataeditSegmentEditWin::AskChoice() {
  QMessageBox box(
      QMessageBox::Warning, QStringLiteral("Segment Changed Elsewhere"),
      QStringLiteral("Another client changed the segment \"%1\" while digits you typed here were not yet "
                     "written. Writing them now would put your version of the vectors held here back over "
                     "theirs.\n\nKeep Mine puts the digits you typed over their version and writes them. "
                     "Take Theirs drops your digits and shows their version. Look First shows the vectors "
                     "as they were, as you typed them and as the other client left them.")
          .arg(QString::fromStdString(mGrid->GetSegmentDs()->GetName())),
      QMessageBox::NoButton, this);
  box.setObjectName(QStringLiteral("ChangedElsewhereQuestion"));
  QPushButton* keep = box.addButton(QStringLiteral("Keep Mine"), QMessageBox::AcceptRole);
  QPushButton* take = box.addButton(QStringLiteral("Take Theirs"), QMessageBox::DestructiveRole);
  QPushButton* look = box.addButton(QStringLiteral("Look First"), QMessageBox::ActionRole);
  keep->setObjectName(QStringLiteral("PButKeepMine"));
  take->setObjectName(QStringLiteral("PButTakeTheirs"));
  look->setObjectName(QStringLiteral("PButLookFirst"));
  box.setDefaultButton(look);
  box.setEscapeButton(look);
  box.exec();
  return box.clickedButton() == keep   ? Choice::kKeepMine
         : box.clickedButton() == take ? Choice::kTakeTheirs
                                       : Choice::kLookFirst;
}

DataeditSegmentEditWin::Choice DataeditSegmentEditWin::AskAfterLooking() {
  QDialog dialog(this);
  dialog.setObjectName(QStringLiteral("ChangedElsewhereCompare"));
  dialog.setWindowTitle(QStringLiteral("Compare with Their Version"));
  auto* layout = new QVBoxLayout(&dialog);
  layout->addWidget(
      new QLabel(QStringLiteral("The vectors held here that differ: as they were read, as you typed them "
                                "and as the other client left them.")));
  auto* table = new QPlainTextEdit(DifferencesText());
  table->setObjectName(QStringLiteral("TextDifferences"));
  table->setReadOnly(true);
  table->setLineWrapMode(QPlainTextEdit::NoWrap);
  table->setFont(QFontDatabase::systemFont(QFontDatabase::FixedFont));
  table->setMinimumSize(520, 260);
  layout->addWidget(table);
  auto* buttons = new QDialogButtonBox;
  QPushButton* keep = buttons->addButton(QStringLiteral("Keep Mine"), QDialogButtonBox::AcceptRole);
  QPushButton* take = buttons->addButton(QStringLiteral("Take Theirs"), QDialogButtonBox::DestructiveRole);
  QPushButton* later = buttons->addButton(QStringLiteral("Decide Later"), QDialogButtonBox::RejectRole);
  keep->setObjectName(QStringLiteral("PButKeepMine"));
  take->setObjectName(QStringLiteral("PButTakeTheirs"));
  later->setObjectName(QStringLiteral("PButLater"));
  layout->addWidget(buttons);
  Choice choice = Choice::kLater;
  connect(keep, &QPushButton::clicked, &dialog, [&] {
    choice = Choice::kKeepMine;
    dialog.accept();
  });
  connect(take, &QPushButton::clicked, &dialog, [&] {
    choice = Choice::kTakeTheirs;
    dialog.accept();
  });
  connect(later, &QPushButton::clicked, &dialog, &QDialog::reject);
  dialog.exec();
  return choice;
}

QString DataeditSegmentEditWin::DifferencesText() const {
  constexpr std::size_t kShown = 500;
  QenSegmentDs* ds = mGrid->GetSegmentDs();
  std::vector<QenSegmentDs::Difference> differences;
  ConditionList list;
  if (ds == nullptr ||
      ds->GetDifferences(static_cast<DataFormat>(mGrid->GetDataFormat(0)), differences, list) != 0) {
    return QString::fromStdString(list.ToText()).trimmed();
  }
  int width = 8;
  for (const auto& d : differences) width = std::max(width, static_cast<int>(d.before.size()) + 2);
  const auto cell = [width](const QString& text) { return text.leftJustified(width); };
  QString text = QStringLiteral("Vector    ") + cell(QStringLiteral("Before")) +
                 cell(QStringLiteral("Yours")) + QStringLiteral("Theirs\n");
  for (std::size_t i = 0; i < differences.size() && i < kShown; ++i) {
    const auto& d = differences[i];
    text += QString::number(d.vector).leftJustified(10) + cell(QString::fromStdString(d.before)) +
            cell(QString::fromStdString(d.mine)) + QString::fromStdString(d.theirs) + QLatin1Char('\n');
  }
  if (differences.size() > kShown)
    text += QStringLiteral("… and %1 more vectors\n").arg(differences.size() - kShown);
  return text;
}

void DataeditSegmentEditWin::Choose(Choice choice) {
  switch (choice) {
    case Choice::kKeepMine:
      Run([this](ConditionList& l) { return mGrid->GetSegmentDs()->KeepMine(l); });
      break;
    case Choice::kTakeTheirs:
      Run([this](ConditionList& l) { return mGrid->GetSegmentDs()->TakeTheirs(l); });
      break;
    case Choice::kLookFirst:
    case Choice::kLater:
      mMessage->setText(
          QStringLiteral("Another client changed this segment under your digits: nothing of yours is "
                         "written until you choose in the Segment menu."));
      ShowState();
      break;
  }
}
