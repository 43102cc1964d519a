// The table models of the simple sequence editor, the event window, the error list and the bit
// error rate window: checked by QAbstractItemModelTester through every change, and followed
// through qensim where the instrument is their source.
#include <gtest/gtest.h>

#include <QAbstractItemModelTester>
#include <QColor>
#include <QPushButton>
#include <QCoreApplication>
#include <QSignalSpy>
#include <QTableView>
#include <map>
#include <memory>

#include "common/gui/GuiSimFixture.h"
#include "core/ErrorJournal.h"
#include "sequences/CPortInfo.h"
#include "sequences/CSequence.h"
#include "support/NumberText.h"
#include "windows/MainWin.h"
#include "windows/ber/BerTableModel.h"
#include "windows/error/ErrorJournalModel.h"
#include "windows/seqedit/BlockReactionModel.h"
#include "windows/smseqedit/SequenceBlockModel.h"

namespace {

using Tester = QAbstractItemModelTester;

// Every cell of `model` against a model made afresh over the same sequence.
std::string Differences(const SequenceBlockModel& model) {
  SequenceBlockModel fresh(model.Table().Sequence(), nullptr);
  if (fresh.rowCount() != model.rowCount() || fresh.columnCount() != model.columnCount())
    return "size " + std::to_string(model.rowCount()) + " rows, " + std::to_string(fresh.rowCount()) + " afresh";
  for (int r = 0; r < fresh.rowCount(); ++r) {
    for (int c = 0; c < fresh.columnCount(); ++c) {
      if (model.index(r, c).data() != fresh.index(r, c).data())
        return "cell " + std::to_string(r) + "," + std::to_string(c) + ": " + model.index(r, c).data().toString().toStdString();
    }
  }
  return "";
}

class SequenceModelTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    static const Dstring initial = Other(":SGEN:GLOB:SEQ?");
    mInitial = initial;
    Other(":SGEN:GLOB:SEQ " + mInitial);
    Poll();
    mSeq = CPortInfo::GetSequence();
    ASSERT_EQ(mSeq->ReadSequence(mList, 0), 0) << mList.ToText();
    // qensim starts with one block: "(3.0,"",<block>)".
    mBlock = mInitial.substr(8, mInitial.size() - 9);
    ASSERT_EQ(mBlock.rfind("(BLOCK,0,512,", 0), 0u) << mInitial;
  }
  // A block of qensim's ports with the given length.
  Dstring Block(unsigned long length) const {
    Dstring block = mBlock;
    block.replace(block.find(",512,"), 5, "," + std::to_string(length) + ",");
    return block;
  }
  // Another client writes the blocks (as "label", block pairs after the first) and the poll reads them.
  void OtherWrites(const Dstring& body) {
    Other(":SGEN:GLOB:SEQ (3.0,\"\"," + body + ")");
    for (int i = 0; i < 20 && mSeq->GetLastExpression() != Other(":SGEN:GLOB:SEQ?"); ++i) Poll();
  }

  Dstring mInitial;
  Dstring mBlock;
  CSequence* mSeq = nullptr;
};

struct Step {
  const char* what;
  std::string body;
  // What the view must have been told: rows inserted, removed, cells changed, resets.
  int inserted;
  int removed;
  int changed;  // -1: either way
  // The block (from 1) the current line must show afterwards.
  int currentBlockLength;
};

// Another client's changes reach the rows precisely: the model equals one made afresh after
// every read, the current line stays on its block, and only a new set of ports is a reset.
TEST_F(SequenceModelTest, TheBlocksFollowAnotherClientRowByRow) {
  SequenceBlockModel model(*mSeq, nullptr);
  Tester tester(&model, Tester::FailureReportingMode::Fatal);
  QTableView view;
  view.setModel(&model);
  OtherWrites("(SEQ," + Block(1) + ",\"\"," + Block(2) + ")");
  ASSERT_EQ(model.rowCount(), 2);
  view.setCurrentIndex(model.index(1, 1));
  const Step steps[] = {
      {"a block above", "(SEQ," + Block(3) + ",\"\"," + Block(1) + ",\"\"," + Block(2) + ")", 1, 0, 0, 2},
      {"a label", "(SEQ," + Block(3) + ",\"mid\"," + Block(1) + ",\"\"," + Block(2) + ")", 0, 0, 1, 2},
      {"a length", "(SEQ," + Block(3) + ",\"mid\"," + Block(1) + ",\"\"," + Block(20) + ")", 0, 0, 1, 20},
      {"the first block gone", "(SEQ," + Block(1) + ",\"\"," + Block(20) + ")", 0, 1, -1, 20},
      {"one gone, two come", "(SEQ," + Block(20) + ",\"\"," + Block(4) + ",\"\"," + Block(5) + ")", 2, 1, 0, 20},
  };
  for (const Step& s : steps) {
    QSignalSpy inserted(&model, &QAbstractItemModel::rowsInserted);
    QSignalSpy removed(&model, &QAbstractItemModel::rowsRemoved);
    QSignalSpy changed(&model, &QAbstractItemModel::dataChanged);
    QSignalSpy reset(&model, &QAbstractItemModel::modelReset);
    OtherWrites(s.body);
    EXPECT_EQ(Differences(model), "") << s.what;
    EXPECT_EQ(inserted.count(), s.inserted) << s.what;
    EXPECT_EQ(removed.count(), s.removed) << s.what;
    if (s.changed >= 0) {
      EXPECT_EQ(changed.isEmpty() ? 0 : 1, s.changed) << s.what;
    }
    EXPECT_EQ(reset.count(), 0) << s.what;
    EXPECT_EQ(model.index(view.currentIndex().row(), 1).data().toString(), QString::number(s.currentBlockLength)) << s.what;
  }
  QSignalSpy reset(&model, &QAbstractItemModel::modelReset);
  ASSERT_EQ(mSeq->ReadSequence(mList, 1), 0);
  EXPECT_EQ(reset.count(), 1) << "a forced read shows everything again";
  EXPECT_EQ(Differences(model), "");
}

// A typed cell reaches the instrument through the runner; a refusal leaves the cell; while
// another client holds the instrument, or the sequence has loops, no cell takes an edit.
TEST_F(SequenceModelTest, CellsWriteThroughTheModelAndTheLockMakesThemReadOnly) {
  SequenceBlockModel model(*mSeq, [](const Dstring& name) { return name == "gone"; });
  Tester tester(&model, Tester::FailureReportingMode::Fatal);
  const QModelIndex length = model.index(0, 1);
  EXPECT_TRUE(model.flags(length) & Qt::ItemIsEditable);
  EXPECT_EQ(model.data(length, Qt::TextAlignmentRole).value<Qt::Alignment>(), Qt::AlignRight | Qt::AlignVCenter);
  ASSERT_TRUE(model.setData(length, QStringLiteral("1024")));
  EXPECT_EQ(length.data().toString(), QStringLiteral("1024"));
  EXPECT_NE(Other(":SGEN:GLOB:SEQ?").find("(BLOCK,0,1024,"), std::string::npos);
  mAlerts.clear();
  EXPECT_FALSE(model.setData(length, QStringLiteral("lots")));
  EXPECT_EQ(length.data().toString(), QStringLiteral("1024"));
  QCoreApplication::processEvents();  // a refusal is shown after the event
  EXPECT_EQ(mAlerts.size(), 1u);

  // A port naming a segment the instrument lacks is drawn red, with a tip.
  Dstring named = Block(8);
  const std::size_t first = named.find("(),") + 3;
  named.replace(first, named.find(',', first) - first, "\"gone\"");
  OtherWrites(named);
  const QModelIndex port = model.index(0, 2);
  EXPECT_EQ(model.NamedSegment(port), "gone");
  EXPECT_EQ(port.data(Qt::ForegroundRole).value<QBrush>().color(), QColor(Qt::red));
  EXPECT_FALSE(port.data(Qt::ToolTipRole).toString().isEmpty());
  EXPECT_FALSE(model.index(0, 3).data(Qt::ForegroundRole).isValid());

  const Dstring before = Other(":SGEN:GLOB:SEQ?");
  Control(":TEST:LOCK ON");
  Poll();
  Poll();
  EXPECT_FALSE(model.flags(length) & Qt::ItemIsEditable);
  EXPECT_FALSE(model.setData(length, QStringLiteral("77")));
  Control(":TEST:LOCK OFF");
  EXPECT_EQ(Other(":SGEN:GLOB:SEQ?"), before);
  Poll();
  Poll();
  EXPECT_TRUE(model.flags(length) & Qt::ItemIsEditable);

  OtherWrites("(LOOP1,0,2,\"\"," + Block(8) + ")");
  EXPECT_FALSE(model.flags(length) & Qt::ItemIsEditable);
  EXPECT_FALSE(model.setData(length, QStringLiteral("77")));
}

// The reactions follow their block's number: changed in place they are rows changed, a count
// that changes or another block at the number is a reset; sync and the lock make them read-only.
TEST_F(SequenceModelTest, TheReactionsOfABlockFollowTheSequence) {
  OtherWrites("(SEQ," + Block(1) + ",\"\"," + Block(2) + ")");
  BlockReactionModel model(*mSeq, 2);
  Tester tester(&model, Tester::FailureReportingMode::Fatal);
  EXPECT_EQ(model.rowCount(), 0);
  QSignalSpy reset(&model, &QAbstractItemModel::modelReset);
  ASSERT_EQ(mSeq->NewReact(2, mList), 0) << mList.ToText();
  EXPECT_EQ(reset.count(), 1);
  ASSERT_EQ(model.rowCount(), 1);
  const QModelIndex trigger = model.index(0, BlockReactionTable::kTrigger);
  ASSERT_TRUE(model.setData(trigger, QStringLiteral("5")));
  EXPECT_EQ(trigger.data().toString(), QStringLiteral("5"));
  EXPECT_NE(Other(":SGEN:GLOB:SEQ?").find(",((\"\",\"\",5,\"\")),"), std::string::npos);
  EXPECT_EQ(reset.count(), 1) << "the same number of reactions: the rows changed";
  mAlerts.clear();
  EXPECT_FALSE(model.setData(trigger, QStringLiteral("five")));
  QCoreApplication::processEvents();
  EXPECT_EQ(mAlerts.size(), 1u);
  EXPECT_EQ(trigger.data().toString(), QStringLiteral("5"));

  OtherWrites("(SEQ," + Block(9) + ",\"\"," + Block(1) + ",\"\"," + Block(2) + ")");
  EXPECT_EQ(model.rowCount(), 0) << "block 2 is now another block";

  ASSERT_EQ(mSeq->NewReact(2, mList), 0);
  EXPECT_TRUE(model.flags(model.index(0, 0)) & Qt::ItemIsEditable);
  Control(":TEST:LOCK ON");
  Poll();
  Poll();
  EXPECT_FALSE(model.flags(model.index(0, 0)) & Qt::ItemIsEditable);
  Control(":TEST:LOCK OFF");
  Poll();
  Poll();
  ASSERT_EQ(mSeq->SetBlockSync(2, 1, mList), 0) << mList.ToText();
  EXPECT_EQ(model.rowCount(), 0) << "a synchronisation block has no reactions";
  model.SetBlock(7);
  EXPECT_EQ(model.rowCount(), 0);
}

struct Button {
  const char* window;
  const char* name;  // empty: the window itself
  bool locked;       // enabled while another client holds the instrument
};

// What stays on in the lock: the error list whole, the error rate window but its reset; the
// sequence windows are off whole. All of it is on again when the lock goes.
TEST_F(SequenceModelTest, TheWindowsButtonsFollowTheLock) {
  std::unique_ptr<MainWin> main = ShowMainWin();
  const Button buttons[] = {
      {"smseqedit.Win", "", false},         {"smseqedit.Win", "PButAdd", false},
      {"seqedit.EventWin", "", false},      {"seqedit.EventWin", "PButNew", false},
      {"error.ErrorWin", "", true},         {"error.ErrorWin", "PButCopy", true},
      {"error.ErrorWin", "PButClear", true}, {"ber.BerWin", "", true},
      {"ber.BerWin", "PButReset", false},   {"ber.BerWin", "PButExportTable", true},
      {"ber.BerWin", "PButExportHistory", true},
  };
  std::map<std::string, QWidget*> windows;
  for (const char* resource : {"smseqedit.Win", "error.ErrorWin", "ber.BerWin"})
    windows[resource] = main->OpenWindow(QString::fromLatin1(resource));
  windows["seqedit.EventWin"] = main->OpenEvents(1);
  const auto enabled = [&](const Button& b) {
    QWidget* w = windows[b.window];
    if (*b.name != 0) w = w->findChild<QPushButton*>(QString::fromLatin1(b.name));
    return w != nullptr && w->isEnabled();
  };
  for (const Button& b : buttons) EXPECT_TRUE(enabled(b)) << b.window << " " << b.name;
  Control(":TEST:LOCK ON");
  Poll();
  Poll();
  for (const Button& b : buttons) EXPECT_EQ(enabled(b), b.locked) << b.window << " " << b.name << " in the lock";
  Control(":TEST:LOCK OFF");
  Poll();
  Poll();
  for (const Button& b : buttons) EXPECT_TRUE(enabled(b)) << b.window << " " << b.name << " after the lock";
}

}  // namespace

// The journal's rows: newest on top, the oldest dropped when it is full, a clear a reset.
TEST(ErrorJournalModelTest, RowsFollowTheJournalAtItsLimit) {
  EnsureApplication();
  ErrorJournal::Clear();
  ErrorJournal::Add(":A", Condition(-113, "Undefined header"));
  ErrorJournal::Add(":B", Condition(-222, "Data out of range"));
  {
    ErrorJournalModel model;
    Tester tester(&model, Tester::FailureReportingMode::Fatal);
    ASSERT_EQ(model.rowCount(), 2);
    EXPECT_EQ(model.index(0, ErrorJournalModel::kCode).data().toString(), QStringLiteral("-222"));
    EXPECT_EQ(model.index(1, ErrorJournalModel::kCommand).data().toString(), QStringLiteral(":A"));
    EXPECT_EQ(model.index(1, ErrorJournalModel::kText).data(Qt::ToolTipRole).toString(), QStringLiteral("Undefined header"));
    const QString time = model.index(0, ErrorJournalModel::kTime).data().toString();
    EXPECT_EQ(model.RowsAsText({model.index(1, 2)}), time + QStringLiteral("\t-113\tUndefined header\t:A"));
    EXPECT_EQ(model.RowsAsText({}).count(QLatin1Char('\n')), 1);
  }
  // Filled to one below its limit before a model follows it: the tester checks every row.
  while (ErrorJournal::Entries().size() < ErrorJournal::kMaxEntries - 1) ErrorJournal::Add(":C", Condition(1, "filler"));
  ErrorJournalModel model;
  Tester tester(&model, Tester::FailureReportingMode::Fatal);
  QSignalSpy removed(&model, &QAbstractItemModel::rowsRemoved);
  QSignalSpy inserted(&model, &QAbstractItemModel::rowsInserted);
  ErrorJournal::Add(":D", Condition(2, "last that fits"));
  EXPECT_EQ(removed.count(), 0);
  EXPECT_EQ(inserted.count(), 1);
  ASSERT_EQ(model.rowCount(), static_cast<int>(ErrorJournal::kMaxEntries));
  ErrorJournal::Add(":E", Condition(3, "one too many"));
  ASSERT_EQ(removed.count(), 1);
  EXPECT_EQ(removed[0][1].toInt(), static_cast<int>(ErrorJournal::kMaxEntries) - 1);
  EXPECT_EQ(inserted.count(), 2);
  ASSERT_EQ(model.rowCount(), static_cast<int>(ErrorJournal::kMaxEntries));
  EXPECT_EQ(model.index(0, ErrorJournalModel::kCommand).data().toString(), QStringLiteral(":E"));
  EXPECT_EQ(model.index(model.rowCount() - 1, ErrorJournalModel::kCommand).data().toString(), QStringLiteral(":B"));

  QSignalSpy reset(&model, &QAbstractItemModel::modelReset);
  ErrorJournal::Clear();
  EXPECT_EQ(reset.count(), 1);
  EXPECT_EQ(model.rowCount(), 0);
}

// New counts of the same ports change only their rows; other ports are a reset.
TEST(BerTableModelTest, CountsChangeTheirRowsAndOtherPortsReset) {
  EnsureApplication();
  BerTableModel model;
  Tester tester(&model, Tester::FailureReportingMode::Fatal);
  std::vector<BerSvr::PortResult> results = {{":CGR1:MOD3:CONN1:BER", 0, 0, 0.0, {}},
                                             {":CGR2:MOD2:CONN1:BER", 1675900, 0, 0.0, {}}};
  model.SetResults(results);
  ASSERT_EQ(model.rowCount(), 2);
  EXPECT_EQ(model.index(0, BerTableModel::kPort).data().toString(), QStringLiteral("Group 1 \u203A Module 3 \u203A Port 1"));
  EXPECT_EQ(model.index(0, BerTableModel::kRatio).data().toString(), QStringLiteral("\u2013"));
  EXPECT_EQ(model.index(1, BerTableModel::kCompared).data().toString().toStdString(), NumberText::Grouped(1675900));
  EXPECT_EQ(model.index(1, BerTableModel::kRatio).data().toString(), QStringLiteral("0"));
  EXPECT_FALSE(model.index(1, BerTableModel::kErrors).data(Qt::ForegroundRole).isValid());

  QSignalSpy changed(&model, &QAbstractItemModel::dataChanged);
  QSignalSpy reset(&model, &QAbstractItemModel::modelReset);
  results[1].errors = 1;
  results[1].compared = 10000;
  model.SetResults(results);
  ASSERT_EQ(changed.count(), 1);
  EXPECT_EQ(changed[0][0].toModelIndex().row(), 1);
  EXPECT_EQ(model.index(1, BerTableModel::kRatio).data().toString(), QStringLiteral("1.00E-04"));
  EXPECT_TRUE(model.index(1, BerTableModel::kErrors).data(Qt::ForegroundRole).isValid());
  model.SetResults(results);
  EXPECT_EQ(changed.count(), 1) << "the same counts change nothing";
  EXPECT_EQ(reset.count(), 0);
  results.pop_back();
  model.SetResults(results);
  EXPECT_EQ(reset.count(), 1);
  EXPECT_EQ(model.rowCount(), 1);
}
