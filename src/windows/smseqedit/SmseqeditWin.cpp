#include "windows/smseqedit/SmseqeditWin.h"

#include <QAction>
#include <QHeaderView>
#include <QLabel>
#include <QLayout>
#include <QPushButton>
#include <QTableWidget>
#include <QTimer>

#include "params/ui/BoundControl.h"
#include "segments/QenSegmentPool.h"
#include "sequences/CPortInfo.h"
#include "sequences/CSequence.h"
#include "sequences/CSequenceBlock.h"
#include "sequences/CSequenceObserver.h"
#include "sequences/SequenceUndo.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "windows/MainWin.h"
#include "windows/PlaceName.h"
#include "windows/dataedit/DataeditSegmentEditWin.h"

namespace {

// The kinds a port's cell may name instead of a segment, as the sequence spells them.
CSequence::SeqSegType KindOf(const QString& text) {
  for (int type = CSequence::SEG_PAUSE; type <= CSequence::SEG_DONTCARE; ++type) {
    const auto kind = static_cast<CSequence::SeqSegType>(type);
    if (text.compare(QLatin1String(CSequence::CSequenceBlock::KeywordOf(kind)), Qt::CaseInsensitive) == 0) return kind;
  }
  return CSequence::SEG_NAMED;
}

}  // namespace

// Every report of a read ends in the same table: it is filled again once, after the read.
class SmseqeditWin::Observer : public CSequenceObserver {
 public:
  explicit Observer(SmseqeditWin& win) : mWin(win) {}
  int NfySequence(ConditionList&) override { return Changed(); }
  int NfyBlockInserted(unsigned long, ConditionList&) override { return Changed(); }
  int NfyBlockDeleted(unsigned long, ConditionList&) override { return Changed(); }
  int NfyBlockLabelChanged(unsigned long, ConditionList&) override { return Changed(); }
  int NfyBlockLengthChanged(unsigned long, ConditionList&) override { return Changed(); }
  int NfySegmentChanged(unsigned long, unsigned long, ConditionList&) override { return Changed(); }
  int NfyUpdateLoops(ConditionList&) override { return Changed(); }

 private:
  int Changed() {
    mWin.MarkStale();
    return 0;
  }
  SmseqeditWin& mWin;
};

SmseqeditWin::SmseqeditWin(QWidget* parent) : QWidget(parent), mObserver(std::make_unique<Observer>(*this)) {
  setObjectName(QStringLiteral("SmseqeditWin"));
}

SmseqeditWin::~SmseqeditWin() {
  mUndo.reset();
  if (CSequence* sequence = GetSequence()) sequence->RemoveObserver(mObserver.get());
}

CSequence* SmseqeditWin::GetSequence() { return CPortInfo::GetSequence(); }

int SmseqeditWin::Load(ConditionList& list) {
  if (int status = ResourceLibrary::LoadInto("smseqedit.Win", this, list)) return status;
  mTable = findChild<QTableWidget*>(QStringLiteral("TableBlocks"));
  mState = findChild<QLabel*>(QStringLiteral("LabelState"));
  auto* add = findChild<QPushButton*>(QStringLiteral("PButAdd"));
  auto* remove = findChild<QPushButton*>(QStringLiteral("PButDelete"));
  auto* up = findChild<QPushButton*>(QStringLiteral("PButUp"));
  auto* down = findChild<QPushButton*>(QStringLiteral("PButDown"));
  mOpenSegment = findChild<QPushButton*>(QStringLiteral("PButOpenSegment"));
  if (mTable == nullptr || mState == nullptr || add == nullptr || remove == nullptr || up == nullptr || down == nullptr ||
      mOpenSegment == nullptr || GetSequence() == nullptr) {
    list.Add(1, "The window resource \"smseqedit.Win\" lacks its table or buttons, or there is no sequence.");
    return 1;
  }
  connect(add, &QPushButton::clicked, this, [this] { Run([this](ConditionList& l) { return AddBlock(l); }); });
  connect(remove, &QPushButton::clicked, this, [this] { Run([this](ConditionList& l) { return DeleteBlock(l); }); });
  connect(up, &QPushButton::clicked, this, [this] { Run([this](ConditionList& l) { return MoveBlock(-1, l); }); });
  connect(down, &QPushButton::clicked, this, [this] { Run([this](ConditionList& l) { return MoveBlock(1, l); }); });
  layout()->setContentsMargins(8, 6, 8, 6);
  setFocusProxy(mTable);
  connect(mTable, &QTableWidget::cellChanged, this, &SmseqeditWin::HitCellChanged);
  connect(mTable, &QTableWidget::currentCellChanged, this, [this] { mOpenSegment->setEnabled(!CurrentSegment().empty()); });
  connect(mOpenSegment, &QPushButton::clicked, this, &SmseqeditWin::HitPButOpenSegment);
  AddBlockActions();
  mTable->horizontalHeader()->setSectionResizeMode(QHeaderView::Interactive);
  GetSequence()->AddObserver(mObserver.get());
  mUndo = std::make_unique<SequenceUndo>(*GetSequence());
  const int status = GetSequence()->ReadSequence(list, 0);
  Rebuild();
  return status;
}

bool SmseqeditWin::IsEditable() const { return GetSequence() != nullptr && GetSequence()->GetLoops().empty(); }

unsigned long SmseqeditWin::CurrentBlock() const {
  return mTable->currentRow() < 0 ? 0 : static_cast<unsigned long>(mTable->currentRow()) + 1;
}

// A read may report many changes; the table is filled once, after the event that read.
void SmseqeditWin::MarkStale() {
  if (mStale) return;
  mStale = true;
  QTimer::singleShot(0, this, [this] {
    if (mStale) Rebuild();
  });
}

void SmseqeditWin::Rebuild() {
  const CSequence* sequence = GetSequence();
  mStale = false;
  if (sequence == nullptr || mTable == nullptr) return;
  mFilling = true;
  const int current = mTable->currentRow();
  const int column = std::max(0, mTable->currentColumn());
  const unsigned long ports = sequence->GetNumPorts();
  mTable->setColumnCount(kFirstPortColumn + static_cast<int>(ports));
  mTable->setHorizontalHeaderItem(0, new QTableWidgetItem(QStringLiteral("Label")));
  mTable->setHorizontalHeaderItem(1, new QTableWidgetItem(QStringLiteral("Length")));
  // The sequence's ports are the data ports in the order of the configuration: a column each,
  // headed by its place on two lines and its type.
  unsigned long p = 0;
  for (const CPortInfo::Port& port : CPortInfo::GetPorts()) {
    if (port.portClass != "PDAT" || ++p > ports) continue;
    QString place = PlaceName(port.path);
    place.replace(place.lastIndexOf(QStringLiteral(" › ")), 3, QStringLiteral("\n"));
    const QString kind = port.type == "OUTPUT_PORT"  ? QStringLiteral("generator")
                         : port.type == "INPUT_PORT" ? QStringLiteral("analyser")
                                                     : QString::fromStdString(port.type);
    auto* header = new QTableWidgetItem(QStringLiteral("%1\n%2").arg(place, kind));
    header->setToolTip(QStringLiteral("%1, %2").arg(PlaceName(port.path), QString::fromStdString(port.model)));
    mTable->setHorizontalHeaderItem(kFirstPortColumn + static_cast<int>(p) - 1, header);
  }
  mTable->setRowCount(static_cast<int>(sequence->GetNumBlocks()));
  const bool editable = IsEditable();
  for (unsigned long b = 1; b <= sequence->GetNumBlocks(); ++b) {
    const int row = static_cast<int>(b - 1);
    QStringList texts = {QString::fromStdString(sequence->GetLabel(b)), QString::number(sequence->GetBlockLength(b))};
    for (unsigned long p = 1; p <= ports; ++p) texts << QString::fromStdString(sequence->GetSegment(b, p));
    // The cells are kept and their texts set: the table may be filled while a cell's edit is
    // being told.
    for (int c = 0; c < texts.size(); ++c) {
      QTableWidgetItem* item = mTable->item(row, c);
      if (item == nullptr) {
        item = new QTableWidgetItem;
        if (c == 1) item->setTextAlignment(Qt::AlignRight | Qt::AlignVCenter);
        mTable->setItem(row, c, item);
      }
      item->setText(texts[c]);
      item->setFlags(editable ? item->flags() | Qt::ItemIsEditable : item->flags() & ~Qt::ItemIsEditable);
    }
  }
  if (mTable->rowCount() > 0) {
    mTable->setCurrentCell(std::clamp(current, 0, mTable->rowCount() - 1), std::min(column, mTable->columnCount() - 1));
  }
  mTable->resizeColumnsToContents();
  mTable->setColumnWidth(0, std::max(mTable->columnWidth(0), 120));
  mTable->setColumnWidth(1, std::max(mTable->columnWidth(1), 80));
  mState->setText(editable ? QStringLiteral("%1 %2. A change goes to the instrument as it is made.")
                                 .arg(mTable->rowCount())
                                 .arg(mTable->rowCount() == 1 ? QStringLiteral("block") : QStringLiteral("blocks"))
                           : QStringLiteral("This sequence has loops: it is shown here, but this editor changes only "
                                            "sequences without loops."));
  for (const char* name : {"PButAdd", "PButDelete", "PButUp", "PButDown"}) {
    if (auto* button = findChild<QPushButton*>(QLatin1String(name))) button->setEnabled(editable);
  }
  mFilling = false;
}

void SmseqeditWin::HitCellChanged(int row, int column) {
  if (mFilling || row < 0) return;
  const QString text = mTable->item(row, column)->text().trimmed();
  Run([this, row, column, &text](ConditionList& l) { return ApplyCell(static_cast<unsigned long>(row) + 1, column, text, l); });
}

int SmseqeditWin::ApplyCell(unsigned long block, int column, const QString& text, ConditionList& list) {
  CSequence* sequence = GetSequence();
  if (column == 0) return sequence->SetLabel(block, text.toStdString(), list);
  if (column == 1) {
    bool number = false;
    const unsigned long length = text.toULong(&number);
    if (!number || length == 0) {
      list.Add(1, Dstring::Format("\"%s\" is no block length: a whole number of vectors above 0.", text.toStdString().c_str()));
      return 1;
    }
    return sequence->SetBlockLength(block, length, list);
  }
  const CSequence::SeqSegType kind = KindOf(text);
  // The sequence takes any name; the instrument would only find out at the run.
  if (kind == CSequence::SEG_NAMED) {
    bool exists = false;
    if (int status = QenSegmentPool::Exists(text.toStdString(), exists, list)) return status;
    if (!exists) {
      list.Add(1, Dstring::Format("There is no segment \"%s\" on the instrument: make it in the segment editor first.",
                                  text.toStdString().c_str()));
      return 1;
    }
  }
  return sequence->SetSegment(block, static_cast<unsigned long>(column - kFirstPortColumn + 1), text.toStdString(), list, kind);
}

void SmseqeditWin::Run(const std::function<int(ConditionList&)>& command) {
  ConditionList list;
  const int status = mUndo->Run(command, list);
  // A refusal shows what the instrument holds; a step shows what it holds now.
  if (status != 0 || mStale) Rebuild();
  BoundControl::Report(list);
}

bool SmseqeditWin::CanUndo() const { return mUndo && mUndo->CanUndo(); }

// A sequence with loops is not this editor's to change, not even back.
int SmseqeditWin::Undo(ConditionList& list) {
  const int status = IsEditable() ? mUndo->Undo(list) : 0;
  Rebuild();
  return status;
}

int SmseqeditWin::Redo(ConditionList& list) {
  const int status = IsEditable() ? mUndo->Redo(list) : 0;
  Rebuild();
  return status;
}

// Cut, copy and paste of whole blocks, on the table's keys and its context menu; the keys are
// the table's own, so a cell being edited keeps them for its text.
void SmseqeditWin::AddBlockActions() {
  struct Entry {
    const char* name;
    const char* text;
    QKeySequence key;
    std::function<int(CSequence&, unsigned long, ConditionList&)> run;
  };
  const Entry entries[] = {
      {"CutBlock", "Cu&t Block", QKeySequence::Cut, [](CSequence& s, unsigned long b, ConditionList& l) { return s.CutBlock(b, l); }},
      {"CopyBlock", "&Copy Block", QKeySequence::Copy, [](CSequence& s, unsigned long b, ConditionList& l) { return s.CopyBlock(b, l); }},
      {"PasteBlock", "&Paste Block After", QKeySequence::Paste,
       [](CSequence& s, unsigned long b, ConditionList& l) { return s.PasteBlockAfter(b, l); }},
  };
  const bool undo[] = {true, false};
  for (const bool back : undo) {
    int (SmseqeditWin::*step)(ConditionList&) = back ? &SmseqeditWin::Undo : &SmseqeditWin::Redo;
    auto* action = new QAction(back ? QStringLiteral("&Undo") : QStringLiteral("&Redo"), mTable);
    action->setObjectName(back ? QStringLiteral("Undo") : QStringLiteral("Redo"));
    // Every key the platform has for it (Redo is Ctrl+Shift+Z and Ctrl+Y).
    action->setShortcuts(back ? QKeySequence::Undo : QKeySequence::Redo);
    action->setShortcutContext(Qt::WidgetShortcut);
    mTable->addAction(action);
    connect(action, &QAction::triggered, this, [this, step = step] {
      ConditionList l;
      (this->*step)(l);
      BoundControl::Report(l);
    });
  }
  for (const Entry& e : entries) {
    auto* action = new QAction(QString::fromUtf8(e.text), mTable);
    action->setObjectName(QLatin1String(e.name));
    action->setShortcut(e.key);
    action->setShortcutContext(Qt::WidgetShortcut);
    mTable->addAction(action);
    connect(action, &QAction::triggered, this, [this, run = e.run] {
      if (!IsEditable()) return;
      Run([this, &run](ConditionList& l) { return CurrentBlock() == 0 ? 0 : run(*GetSequence(), CurrentBlock(), l); });
    });
  }
  mTable->setContextMenuPolicy(Qt::ActionsContextMenu);
}

Dstring SmseqeditWin::CurrentSegment() const {
  const int column = mTable->currentColumn();
  const unsigned long block = CurrentBlock();
  if (block == 0 || column < kFirstPortColumn) return {};
  const auto port = static_cast<unsigned long>(column - kFirstPortColumn + 1);
  return GetSequence()->GetType(block, port) == CSequence::SEG_NAMED ? GetSequence()->GetSegment(block, port) : Dstring();
}

// The segment editor of the main window shows the segment; asking again raises the same window.
void SmseqeditWin::HitPButOpenSegment() {
  const Dstring name = CurrentSegment();
  auto* main = qobject_cast<MainWin*>(window());
  if (name.empty() || main == nullptr) return;
  auto* editor = qobject_cast<DataeditSegmentEditWin*>(main->OpenWindow(QStringLiteral("dataedit.SegmentEditWin")));
  if (editor == nullptr) return;
  ConditionList list;
  editor->ShowSegment(name, list);
  BoundControl::Report(list);
}

int SmseqeditWin::AddBlock(ConditionList& list) {
  const unsigned long after = CurrentBlock();
  if (int status = GetSequence()->AddBlockAfter(after, list)) return status;
  mTable->setCurrentCell(static_cast<int>(after), std::max(0, mTable->currentColumn()));
  return 0;
}

int SmseqeditWin::DeleteBlock(ConditionList& list) {
  const unsigned long block = CurrentBlock();
  return block == 0 ? 0 : GetSequence()->DeleteBlock(block, list);
}

int SmseqeditWin::MoveBlock(long distance, ConditionList& list) {
  const unsigned long block = CurrentBlock();
  if (block == 0) return 0;
  if (int status = GetSequence()->MoveBlock(block, distance, list)) return status;
  mTable->setCurrentCell(static_cast<int>(static_cast<long>(block) - 1 + distance), std::max(0, mTable->currentColumn()));
  return 0;
}
