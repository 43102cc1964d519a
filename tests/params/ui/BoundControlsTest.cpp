#include <gtest/gtest.h>

#include <QAbstractSpinBox>
#include <QApplication>
#include <QComboBox>
#include <QContextMenuEvent>
#include <QDir>
#include <QMenu>
#include <QPluginLoader>
#include <QPushButton>
#include <QRadioButton>
#include <QTest>
#include <QTimer>
#include <QtUiPlugin/QDesignerCustomWidgetCollectionInterface>
#include <memory>

#include "common/gui/GuiSimFixture.h"
#include "instrument/QenGuiInst.h"
#include "params/ui/ParSpinBox.h"
#include "params/ui/QenDsCBox.h"
#include "params/ui/QenDsCBut.h"
#include "params/ui/QenDsRBut.h"
#include "params/ui/QenDsSTEd.h"
#include "params/ui/QenDsSlidr.h"
#include "params/ui/QenParEd.h"
#include "params/ui/QenParLb.h"
#include "params/ui/UnitLabel.h"
#include "params/ui/UnitsDialog.h"
#include "params/ui/UnitsdlgUnitsDialog.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "toolkit/qt/StatusNotice.h"
#include "toolkit/qt/WidgetClassTable.h"

namespace {

const char* const kAmpl = ":CGR1:MOD1:CONN1:VOLT:AMPL";

// The test form of every control kind, bound to qensim through the whole library.
class BoundControlsTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    // One qensim serves the suite: every test starts from the same settings.
    for (const char* reset : {":CGR1:MOD1:CONN1:VOLT:AMPL 1", ":TRIG:MODE SEQ", ":CGR1:MOD1:CONN1:OUTP OFF",
                              ":CGR1:MOD1:CONN1:VOLT:OFFS 0.5", ":CGR1:MOD1:CONN1:PULS:DEL 0", ":CGR1:FREQ 1E9",
                              ":CGR1:MOD1:CONN1:VOLT:AMPL:ATTR (\"V\",-3,0,0,0.1d)",
                              ":CGR1:MOD1:CONN1:PULS:DEL:ATTR (\"s\",-12,0,-9,0.1d)"}) {
      Other(reset);
    }
    mForm.reset(ResourceLibrary::Load("qtest.BoundControls", nullptr, mList));
    ASSERT_NE(mForm, nullptr) << mList.ToText();
    ASSERT_EQ(BoundControl::SetDsBaseNameAll(mForm.get(), ":" + mHandle, mList), 0) << mList.ToText();
    mForm->show();
    QApplication::setActiveWindow(mForm.get());
  }
  void TearDown() override {
    // The field with the focus commits as the form goes; its report is shown while this
    // test's toolkit still runs, so that it does not stay pending for the next test.
    mForm.reset();
    QCoreApplication::processEvents();
    GuiSimFixture::TearDown();
  }
  template <class T>
  T* Find(const char* name) {
    T* widget = mForm->findChild<T*>(QString::fromLatin1(name));
    EXPECT_NE(widget, nullptr) << name;
    return widget;
  }
  // A command on the library's own connection (a test-control command acts on its replies).
  void Gui(const Dstring& cmd) {
    Dstring reply;
    ASSERT_EQ(QenGuiInst::Call(cmd, reply, mList), 0) << cmd << mList.ToText();
  }
  // From now on every reply to `header` on the library's connection is `text`.
  void Garble(const Dstring& header, const Dstring& text) {
    Dstring quoted;
    for (char c : text) quoted += c == '"' ? Dstring("\"\"") : Dstring(1, c);
    Gui(":TEST:MALF \"" + header + "?\",\"" + quoted + "\",0");
  }
  static bool ShowsFailed(const QenParField* field) {
    return field->Editor()->palette().color(QPalette::Base) == field->mBgColorFailed;
  }
  // A text field over the trigger mode, added to the form.
  QenDsSTEd* TriggerText() {
    auto* text = new QenDsSTEd(mForm.get());
    text->setProperty("DsCmdName", QStringLiteral(":TRIG:MODE"));
    text->NfyInit();
    EXPECT_EQ(text->SetDsBaseName(":" + mHandle, mList), 0) << mList.ToText();
    text->show();
    return text;
  }
  // Types `text` over the field's text and presses `key`.
  void Type(QenParField* field, const QString& text, Qt::Key key = Qt::Key_Return) {
    field->Editor()->setFocus();
    QTest::keyClick(field->Editor(), Qt::Key_A, Qt::ControlModifier);
    QTest::keyClick(field->Editor(), Qt::Key_Backspace);
    QTest::keyClicks(field->Editor(), text);
    QTest::keyClick(field->Editor(), key);
    QCoreApplication::processEvents();
  }

  std::unique_ptr<QWidget> mForm;
};

}  // namespace

TEST_F(BoundControlsTest, EveryControlShowsTheInstrumentAfterBinding) {
  EXPECT_EQ(Find<QenParEd>("fieldAmpl")->Editor()->Text(), "1");
  EXPECT_EQ(Find<QenParEd>("fieldAmpl")->GetUnitLabel()->text(), " V");
  EXPECT_EQ(Find<QenParLb>("fieldFreq")->Editor()->Text(), "1000");
  EXPECT_EQ(Find<QenParLb>("fieldFreq")->GetUnitLabel()->text(), "MHz");
  EXPECT_EQ(Find<QenParEd>("fieldDelay")->GetUnitLabel()->text(), "ns");
  EXPECT_EQ(Find<QenDsCBox>("boxTrigger")->currentText(), "Sequence");
  EXPECT_TRUE(Find<QenDsRBut>("radioSeq")->isChecked());
  EXPECT_FALSE(Find<QenDsCBut>("checkOutput")->isChecked());
  EXPECT_EQ(Find<QenDsSlidr>("sliderOffset")->value(), 500);
  EXPECT_EQ(Find<QenDsSTEd>("textType")->text().toStdString(), "K2268A");  // read-only: a plain text
  EXPECT_TRUE(Find<QenParEd>("fieldAmpl")->toolTip().endsWith(kAmpl));
}

TEST_F(BoundControlsTest, ASecondClientsChangesAppearWithinOnePoll) {
  Other(Dstring(kAmpl) + " 2.5");
  Other(":TRIG:MODE CLOC");
  Other(":CGR1:MOD1:CONN1:OUTP ON");
  Other(":CGR1:MOD1:CONN1:VOLT:OFFS 1.25");
  Other(":CGR1:FREQ 2.5E9");
  Poll();
  EXPECT_EQ(Find<QenParEd>("fieldAmpl")->Editor()->Text(), "2.5");
  EXPECT_EQ(Find<QenParLb>("fieldFreq")->Editor()->Text(), "2500");
  EXPECT_EQ(Find<QenDsCBox>("boxTrigger")->currentText(), "Clock");
  EXPECT_TRUE(Find<QenDsRBut>("radioClock")->isChecked());
  EXPECT_FALSE(Find<QenDsRBut>("radioSeq")->isChecked());
  EXPECT_TRUE(Find<QenDsCBut>("checkOutput")->isChecked());
  EXPECT_EQ(Find<QenDsSlidr>("sliderOffset")->value(), 1250);
}

TEST_F(BoundControlsTest, TypedAndSteppedValuesReachTheServer) {
  auto* field = Find<QenParEd>("fieldAmpl");
  Type(field, "1.5");
  EXPECT_DOUBLE_EQ(OtherNumber(kAmpl), 1.5);
  QTest::keyClick(field->Editor(), Qt::Key_Up);
  EXPECT_DOUBLE_EQ(OtherNumber(kAmpl), 1.6);
  QTest::keyClick(field->Editor(), Qt::Key_Down);
  QTest::keyClick(field->Editor(), Qt::Key_Down);
  EXPECT_DOUBLE_EQ(OtherNumber(kAmpl), 1.4);
  EXPECT_EQ(field->Editor()->Text(), "1.4");
  // A page key is swallowed; a unit typed after the number is ignored.
  QTest::keyClick(field->Editor(), Qt::Key_PageUp);
  EXPECT_DOUBLE_EQ(OtherNumber(kAmpl), 1.4);
  Type(field, "2 V");
  EXPECT_DOUBLE_EQ(OtherNumber(kAmpl), 2.0);
  EXPECT_TRUE(mAlerts.empty());
}

TEST_F(BoundControlsTest, FocusLossCommitsAndAnEmptyFieldKeepsTheValue) {
  auto* field = Find<QenParEd>("fieldAmpl");
  Type(field, "3", Qt::Key_Tab);
  EXPECT_DOUBLE_EQ(OtherNumber(kAmpl), 3.0);
  Type(field, "", Qt::Key_Tab);
  EXPECT_DOUBLE_EQ(OtherNumber(kAmpl), 3.0);
}

TEST_F(BoundControlsTest, AValueTheInstrumentRoundedIsMarked) {
  auto* field = Find<QenParEd>("fieldAmpl");
  Type(field, "1.2345");
  EXPECT_DOUBLE_EQ(OtherNumber(kAmpl), 1.235);
  EXPECT_EQ(field->Editor()->Text(), "1.235");
  EXPECT_TRUE(field->IsMarkedAdjusted());
  EXPECT_EQ(field->toolTip(), "set to 1.235 V (asked 1.2345 V)");
}

TEST_F(BoundControlsTest, ARefusedValueIsReportedAndTheServersValueShown) {
  auto* field = Find<QenParEd>("fieldAmpl");
  Type(field, "9");
  QCoreApplication::processEvents();
  ASSERT_EQ(mAlerts.size(), 1u);
  EXPECT_NE(mAlerts[0].find("-222"), Dstring::npos) << mAlerts[0];
  EXPECT_EQ(field->Editor()->Text(), "1");
  EXPECT_DOUBLE_EQ(OtherNumber(kAmpl), 1.0);
}

TEST_F(BoundControlsTest, ALockDuringACommitIsSilentAndLosesNothingOnTheServer) {
  Control(":TEST:LOCK ON");
  Type(Find<QenParEd>("fieldAmpl"), "4");
  Find<QenParEd>("fieldDelay")->GetUnitLabel()->NfyPopupMenuItemSelect(88);
  QCoreApplication::processEvents();
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();
  Control(":TEST:LOCK OFF");
  EXPECT_DOUBLE_EQ(OtherNumber(kAmpl), 1.0);
}

TEST_F(BoundControlsTest, PrefixFromTheMenuGoesToTheServerAndComesBack) {
  auto* delay = Find<QenParEd>("fieldDelay");
  Other(":CGR1:MOD1:CONN1:PULS:DEL 2.5E-10");
  Poll();
  EXPECT_EQ(delay->Editor()->Text(), "0.25");
  delay->GetUnitLabel()->NfyPopupMenuItemSelect(88);
  EXPECT_EQ(Other(":CGR1:MOD1:CONN1:PULS:DEL:ATTR?"), "(\"s\",-12,0,-12,0.100000d)");
  Poll();
  EXPECT_EQ(delay->GetUnitLabel()->text(), "ps");
  EXPECT_EQ(delay->Editor()->Text(), "250");
}

// From the keyboard, Shift+F10 or the menu key on a field open its unit's prefix and step menu;
// the mouse keeps the text's own menu.
TEST_F(BoundControlsTest, TheKeyboardOpensTheUnitMenuOfAField) {
  auto* ampl = Find<QenParEd>("fieldAmpl");
  auto unitMenu = [] {
    auto* menu = qobject_cast<QMenu*>(QApplication::activePopupWidget());
    const bool prefix = menu != nullptr && !menu->actions().empty() && menu->actions().front()->text() == "&Prefix";
    if (menu != nullptr) menu->close();
    return prefix;
  };
  QTest::keyClick(ampl->Editor(), Qt::Key_F10, Qt::ShiftModifier);
  EXPECT_TRUE(unitMenu());
  QContextMenuEvent key(QContextMenuEvent::Keyboard, QPoint(1, 1), ampl->Editor()->mapToGlobal(QPoint(1, 1)));
  QApplication::sendEvent(ampl->Editor(), &key);
  EXPECT_TRUE(unitMenu());
  QTimer::singleShot(0, [&] { EXPECT_FALSE(unitMenu()); });
  QContextMenuEvent mouse(QContextMenuEvent::Mouse, QPoint(1, 1), ampl->Editor()->mapToGlobal(QPoint(1, 1)));
  QApplication::sendEvent(ampl->Editor(), &mouse);
}

TEST_F(BoundControlsTest, UnitsDialogSetsPrefixAndStep) {
  auto* ampl = Find<QenParEd>("fieldAmpl");
  QTimer::singleShot(0, [] {
    auto* dialog = qobject_cast<UnitsdlgUnitsDialog*>(QApplication::activeModalWidget());
    ASSERT_NE(dialog, nullptr);
    EXPECT_FALSE(dialog->findChild<QRadioButton*>("RButUnitKilo")->isVisibleTo(dialog));
    EXPECT_EQ(dialog->findChild<QRadioButton*>("RButUnitMilli")->text(), "mV");
    EXPECT_TRUE(dialog->findChild<QRadioButton*>("RButStep_1")->isChecked());
    dialog->findChild<QRadioButton*>("RButUnitMilli")->click();
    dialog->findChild<QRadioButton*>("RButStep10")->click();
    dialog->findChild<QPushButton*>("PButOK")->click();
  });
  QTest::mouseClick(ampl->GetUnitLabel(), Qt::LeftButton);
  EXPECT_EQ(Other(Dstring(kAmpl) + ":ATTR?"), "(\"V\",-3,0,-3,10.000000d)");
  Poll();
  QApplication::setActiveWindow(mForm.get());
  ampl->Editor()->setFocus();
  EXPECT_EQ(ampl->GetUnitLabel()->text(), "mV");
  EXPECT_EQ(ampl->Editor()->Text(), "1000");
  QTest::keyClick(ampl->Editor(), Qt::Key_Down);
  EXPECT_DOUBLE_EQ(OtherNumber(kAmpl), 0.99);
}

TEST_F(BoundControlsTest, ChoicesOfButtonsBoxAndSliderAreWritten) {
  Find<QenDsCBox>("boxTrigger")->setFocus();
  QTest::keyClick(Find<QenDsCBox>("boxTrigger"), Qt::Key_Down);
  EXPECT_EQ(Other(":TRIG:MODE?"), "CLOC");
  QTest::mouseClick(Find<QenDsRBut>("radioSeq"), Qt::LeftButton);
  EXPECT_EQ(Other(":TRIG:MODE?"), "SEQ");
  Find<QenDsCBut>("checkOutput")->click();
  EXPECT_EQ(Other(":CGR1:MOD1:CONN1:OUTP?"), "ON");
  auto* slider = Find<QenDsSlidr>("sliderOffset");
  slider->setFocus();
  QTest::keyClick(slider, Qt::Key_Right);
  EXPECT_DOUBLE_EQ(OtherNumber(":CGR1:MOD1:CONN1:VOLT:OFFS"), 0.501);
  EXPECT_TRUE(mAlerts.empty());
}

TEST_F(BoundControlsTest, TheWheelLeavesAnUnfocusedControlAlone) {
  auto* slider = Find<QenDsSlidr>("sliderOffset");
  Find<QenParEd>("fieldAmpl")->Editor()->setFocus();
  QWheelEvent wheel(QPointF(5, 5), slider->mapToGlobal(QPointF(5, 5)), QPoint(), QPoint(0, 120), Qt::NoButton,
                    Qt::NoModifier, Qt::NoScrollPhase, false);
  QApplication::sendEvent(slider, &wheel);
  QApplication::sendEvent(Find<QenDsCBox>("boxTrigger"), &wheel);
  EXPECT_DOUBLE_EQ(OtherNumber(":CGR1:MOD1:CONN1:VOLT:OFFS"), 0.5);
  EXPECT_EQ(Other(":TRIG:MODE?"), "SEQ");
}

TEST_F(BoundControlsTest, ThePlainUnitKeepsItsBlankInTheMenuAndTheDialog) {
  auto* ampl = Find<QenParEd>("fieldAmpl");
  std::unique_ptr<QMenu> menu(ampl->GetUnitLabel()->BuildPopupMenu(nullptr));
  QStringList shown;
  for (QAction* item : menu->actions().first()->menu()->actions()) {
    if (item->isVisible()) shown << item->text();
  }
  EXPECT_EQ(shown.join('|'), " V|mV");
  UnitsDialog dialog("unitsdlg");
  UnitsRecord units = ampl->State().GetUnits();
  dialog.NfyInit(units);
  EXPECT_EQ(dialog.findChild<QRadioButton*>("RBut1Unit")->text(), " V");
  EXPECT_EQ(dialog.findChild<QRadioButton*>("RButUnitMilli")->text(), "mV");
}

// The label and the text stay as they were; the field shows that the attribute failed, and why.
TEST_F(BoundControlsTest, AMalformedUnitAttributeLeavesLabelAndText) {
  auto* ampl = Find<QenParEd>("fieldAmpl");
  Garble(Dstring(kAmpl) + ":ATTR", "(\"V\",oops,0,-3,0.1d)");
  Other(Dstring(kAmpl) + " 2.5");
  Other(Dstring(kAmpl) + ":ATTR (\"V\",-3,0,-3,0.1d)");
  Poll();
  EXPECT_EQ(ampl->Editor()->Text(), "1");
  EXPECT_EQ(ampl->GetUnitLabel()->text(), " V");
  EXPECT_TRUE(ShowsFailed(ampl));
  EXPECT_NE(ampl->toolTip().indexOf("oops"), -1) << ampl->toolTip().toStdString();
}

TEST_F(BoundControlsTest, AComboBoxWithNoValueSaysSoAndKeepsItsChoice) {
  auto* box = Find<QenDsCBox>("boxTrigger");
  ASSERT_EQ(box->currentIndex(), 0);
  for (const char* mark : {"CLAS", "9.91E37"}) {
    Garble(":TRIG:MODE", mark);
    Other(":TRIG:MODE CLOC");
    Poll();
    EXPECT_EQ(box->ShownText(), "<No Value>") << mark;
    EXPECT_EQ(box->currentIndex(), 0) << mark;
    Other(":TRIG:MODE SEQ");
  }
  Garble(":TRIG:MODE", "CLOC");
  Other(":TRIG:MODE CLOC");
  Poll();
  EXPECT_EQ(box->ShownText(), "Clock");
  EXPECT_EQ(box->currentIndex(), 1);
}

// The text goes out as it stands when the field is left, edited or not, and when its window
// goes to the background while the field has the focus.
TEST_F(BoundControlsTest, ATextFieldWritesItsTextWhenLeft) {
  QenDsSTEd* text = TriggerText();
  ASSERT_EQ(text->text(), "SEQ");
  Other(":TRIG:MODE CLOC");
  text->setFocus();
  Find<QenDsCBox>("boxTrigger")->setFocus();
  EXPECT_EQ(Other(":TRIG:MODE?"), "SEQ") << "focus loss";
  Other(":TRIG:MODE CLOC");
  text->setFocus();
  QWidget elsewhere;
  elsewhere.show();
  QApplication::setActiveWindow(&elsewhere);
  EXPECT_EQ(Other(":TRIG:MODE?"), "SEQ") << "window left";
  EXPECT_TRUE(mAlerts.empty());
}

// A refused text stays for correcting; leaving the field (as the error dialog takes the focus)
// does not send it again, a changed text goes out.
TEST_F(BoundControlsTest, ARefusedTextIsNotSentAgainUntilChanged) {
  QenDsSTEd* text = TriggerText();
  text->setFocus();
  text->selectAll();
  QTest::keyClicks(text, "SIDEWAYS");
  QTest::keyClick(text, Qt::Key_Return);
  Find<QenDsCBox>("boxTrigger")->setFocus();
  QCoreApplication::processEvents();
  ASSERT_EQ(mAlerts.size(), 1u);
  EXPECT_EQ(mAlerts[0].find("ERROR", mAlerts[0].find("ERROR") + 1), Dstring::npos) << mAlerts[0];
  EXPECT_EQ(text->text(), "SIDEWAYS");
  text->setFocus();
  text->selectAll();
  QTest::keyClicks(text, "CLOC");
  Find<QenDsCBox>("boxTrigger")->setFocus();
  EXPECT_EQ(Other(":TRIG:MODE?"), "CLOC");
}

// A read-only text field never writes, however it is left.
TEST_F(BoundControlsTest, AReadOnlyTextFieldNeverWrites) {
  auto* text = Find<QenDsSTEd>("textType");
  text->setFocus();
  QTest::keyClick(text, Qt::Key_Return);
  Find<QenDsCBox>("boxTrigger")->setFocus();
  QCoreApplication::processEvents();
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();
}

TEST(QenParFieldTest, ClearedIsEnabledAtInitLeavesTheUnitLabelEnabled) {
  EnsureApplication();
  QenParEd field;
  field.setProperty("IsEnabled", false);
  field.NfyInit();
  EXPECT_FALSE(field.Editor()->isEnabled());
  EXPECT_TRUE(field.GetUnitLabel()->isEnabled());
  field.SetIsEnabled(true);
  field.SetIsEnabled(false);
  EXPECT_FALSE(field.Editor()->isEnabled());
  EXPECT_TRUE(field.GetUnitLabel()->isEnabled());
}

TEST_F(BoundControlsTest, AClearedFieldShowsTheInstrumentsValueAgain) {
  auto* field = Find<QenParEd>("fieldAmpl");
  for (Qt::Key key : {Qt::Key_Tab, Qt::Key_Return}) {
    Type(field, "", key);
    EXPECT_EQ(field->Editor()->Text(), "1") << key;
  }
  EXPECT_DOUBLE_EQ(OtherNumber(kAmpl), 1.0);
}

// Typed text and a step: the field shows the value stepped from the typed one, as sent.
TEST_F(BoundControlsTest, AStepAfterTypingShowsTheValueSent) {
  auto* field = Find<QenParEd>("fieldAmpl");
  field->Editor()->setFocus();
  QTest::keyClick(field->Editor(), Qt::Key_A, Qt::ControlModifier);
  QTest::keyClicks(field->Editor(), "2");
  QTest::keyClick(field->Editor(), Qt::Key_Up);
  EXPECT_DOUBLE_EQ(OtherNumber(kAmpl), 2.1);
  EXPECT_EQ(field->Editor()->Text(), "2.1");
}

TEST_F(BoundControlsTest, AValueTheFieldCannotReadIsShownFailedWithTheReason) {
  auto* field = Find<QenParEd>("fieldAmpl");
  ASSERT_FALSE(ShowsFailed(field));
  Garble(kAmpl, "abc");
  Other(Dstring(kAmpl) + " 2.5");
  Poll();
  EXPECT_EQ(field->Editor()->Text(), "1");
  EXPECT_TRUE(ShowsFailed(field));
  EXPECT_NE(field->toolTip().indexOf("\"abc\""), -1) << field->toolTip().toStdString();
  Garble(kAmpl, "2.5");
  Other(Dstring(kAmpl) + " 2");
  Poll();
  EXPECT_EQ(field->Editor()->Text(), "2.5");
  EXPECT_FALSE(ShowsFailed(field));
  EXPECT_EQ(field->toolTip().indexOf("abc"), -1);
}

// The leading number is sent; what follows it, or text without a number, is said on the field
// and in the status bar until the field's next commit.
TEST_F(BoundControlsTest, TextACommitLeavesOutIsSaid) {
  QStringList notices;
  StatusNotice::Install([&notices](const QString& text) { notices << text; });
  const struct {
    const char* field;
    const char* typed;
    const char* header;
    double held;
    const char* notice;
  } kCases[] = {
      {"fieldFreq", "2G", ":CGR1:FREQ", 2e6, "2 MHz sent; \"G\" ignored: this field is in MHz"},
      {"fieldAmpl", "0.5m", kAmpl, 0.5, "0.5 V sent; \"m\" ignored: this field is in V"},
      {"fieldAmpl", "2 V", kAmpl, 2.0, ""},
      {"fieldFreq", "abc", ":CGR1:FREQ", 2e6, "0 MHz sent; \"abc\" ignored: this field is in MHz"},
  };
  for (const auto& c : kCases) {
    auto* field = Find<QenParField>(c.field);
    notices.clear();
    Type(field, QString::fromLatin1(c.typed));
    const QString notice = QString::fromLatin1(c.notice);
    EXPECT_DOUBLE_EQ(OtherNumber(c.header), c.held) << c.typed;
    EXPECT_EQ(field->Notice(), notice) << c.typed;
    EXPECT_EQ(notices, notice.isEmpty() ? QStringList() : QStringList{notice}) << c.typed;
    EXPECT_TRUE(field->toolTip().startsWith(notice)) << field->toolTip().toStdString();
  }
  // 0 MHz is below the instrument's limit: refused, and the field shows the value it holds.
  QCoreApplication::processEvents();
  ASSERT_EQ(mAlerts.size(), 1u);
  EXPECT_NE(mAlerts[0].find("-222"), Dstring::npos) << mAlerts[0];
  auto* freq = Find<QenParField>("fieldFreq");
  EXPECT_EQ(freq->Editor()->Text(), "2");
  Type(freq, "3");
  EXPECT_EQ(freq->Notice(), "");
  EXPECT_EQ(freq->toolTip().indexOf("ignored"), -1);
  StatusNotice::Install({});
}

TEST_F(BoundControlsTest, MissingAndBrokenResourcesAreNamed) {
  ConditionList list;
  EXPECT_EQ(ResourceLibrary::Load("nosuch.Window", nullptr, list), nullptr);
  ASSERT_EQ(list.Size(), 1u);
  EXPECT_NE(list[0].GetMessage().find("nosuch.Window"), Dstring::npos);
  EXPECT_NE(ResourceLibrary::Check("nosuchlibrary", list), 0);
  EXPECT_NE(WidgetClassTable::Register("NoSuchClass", list), 0);
  EXPECT_EQ(list.Size(), 3u);
}

TEST_F(BoundControlsTest, Screenshot) {
  const QByteArray dir = qgetenv("QEN_SCREENSHOT_DIR");
  Type(Find<QenParEd>("fieldAmpl"), "1.2345");
  mForm->resize(460, 280);
  const QPixmap picture = mForm->grab();
  EXPECT_FALSE(picture.isNull());
  if (!dir.isEmpty()) {
    EXPECT_TRUE(picture.save(QDir(QString::fromLocal8Bit(dir)).filePath("bound-controls.png")));
  }
}

#ifdef QEN_DESIGNER_PLUGIN
TEST(DesignerPluginTest, LoadsAndListsTheControls) {
  EnsureApplication();
  QPluginLoader loader(QStringLiteral(QEN_DESIGNER_PLUGIN));
  auto* collection = qobject_cast<QDesignerCustomWidgetCollectionInterface*>(loader.instance());
  ASSERT_NE(collection, nullptr) << loader.errorString().toStdString();
  QStringList names;
  for (auto* widget : collection->customWidgets()) names << widget->name();
  EXPECT_EQ(names.join(','), "QenDsCBut,QenDsRBut,QenDsCBox,QenDsSlidr,QenDsSTEd,QenParEd,QenParLb,UnitEd,LbUnitEd");
  QWidget* field = collection->customWidgets()[5]->createWidget(nullptr);
  EXPECT_TRUE(field->setProperty("DsCmdName", QStringLiteral(":CGR1:FREQ")));
  EXPECT_EQ(field->property("DsCmdName").toString(), ":CGR1:FREQ");
  EXPECT_TRUE(field->property("ShowUnits").toBool());
  delete field;
}
#endif
