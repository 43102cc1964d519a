#include "windows/paramedit/ParameditParamEdWin.h"

#include <QGridLayout>
#include <QLabel>
#include <QSplitter>
#include <QStackedWidget>
#include <QTreeWidget>

#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "params/MemorySize.h"
#include "params/ui/BoundControl.h"
#include "sequences/CPortInfo.h"
#include "support/DataParcel.h"
#include "support/ParserExpression.h"
#include "toolkit/WaitCursor.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "ui_paramedit.ParamEd.h"

namespace {

constexpr int kPathRole = Qt::UserRole;
constexpr int kPanelRole = Qt::UserRole + 1;

QString Text(const Dstring& text) { return QString::fromStdString(text); }

// ":CGR1:MOD2:CONN3" → ":CGR1", ":CGR1:MOD2".
Dstring Prefix(const Dstring& path, int elements) {
  std::size_t at = 0;
  for (int i = 0; i <= elements && at != Dstring::npos; ++i) at = path.find(':', at + 1);
  return at == Dstring::npos ? path : Dstring(path.substr(0, at));
}

Dstring Number(const Dstring& element, const char* word) { return Dstring(element.substr(element.rfind(word) + std::strlen(word))); }

const char* PortPanel(const CPortInfo::Port& port) {
  if (port.portClass == "PCLK") return "paramedit.ClockPortPanel";
  return port.type == "INPUT_PORT" ? "paramedit.AnalyserPortPanel" : "paramedit.GeneratorPortPanel";
}

const char* PortKind(const CPortInfo::Port& port) {
  if (port.portClass == "PCLK") return "clock out";
  return port.type == "INPUT_PORT" ? "data in" : "data out";
}

}  // namespace

ParameditParamEdWin::ParameditParamEdWin(QWidget* parent) : QWidget(parent), mUi(std::make_unique<Ui::ParamEd>()) {
  setObjectName(QStringLiteral("ParameditParamEdWin"));
}

ParameditParamEdWin::~ParameditParamEdWin() = default;

void ParameditParamEdWin::FormatMemory(unsigned long bits, Dstring& number, Dstring& unit) {
  MemorySize::Format(bits, number, unit);
}

int ParameditParamEdWin::Load(ConditionList& list) {
  mUi->setupUi(this);
  ResourceLibrary::InitWidgets(this);
  mTree = mUi->TreeInstrument;
  mStack = mUi->StackPanels;
  mTitle = mUi->LabelPanelTitle;
  connect(mTree, &QTreeWidget::itemSelectionChanged, this, &ParameditParamEdWin::NfySelectionChanged);
  mUnread = new QLabel(mStack);
  mUnread->setObjectName(QStringLiteral("LabelUnread"));
  mUnread->setAlignment(Qt::AlignCenter);
  mUnread->setWordWrap(true);
  mStack->addWidget(mUnread);
  mUi->Splitter->setStretchFactor(0, 0);
  mUi->Splitter->setStretchFactor(1, 1);
  mUi->Splitter->setSizes({260, 520});
  if (int status = Rebuild(list)) return status;
  // The first port is where most work starts.
  if (!CPortInfo::GetPorts().empty()) SelectPath(CPortInfo::GetPorts().front().path);
  return 0;
}

int ParameditParamEdWin::Rebuild(ConditionList& list) {
  if (int status = CPortInfo::Update(list)) return status;
  mTree->clear();
  std::map<Dstring, QTreeWidgetItem*> items;
  auto item = [&](const Dstring& path, QTreeWidgetItem* parent, const QString& text, const char* panel) {
    auto& slot = items[path];
    if (slot != nullptr) return slot;
    slot = parent ? new QTreeWidgetItem(parent) : new QTreeWidgetItem(mTree);
    slot->setText(0, text);
    slot->setData(0, kPathRole, Text(path));
    slot->setData(0, kPanelRole, QString::fromLatin1(panel));
    slot->setExpanded(true);
    return slot;
  };
  for (const CPortInfo::Port& port : CPortInfo::GetPorts()) {
    const Dstring group = Prefix(port.path, 0);
    const Dstring module = Prefix(port.path, 1);
    QTreeWidgetItem* g = item(group, nullptr, QStringLiteral("Clock group %1").arg(Text(Number(group, "CGR"))),
                              "paramedit.ClockGroupPanel");
    QTreeWidgetItem* m = item(module, g, QStringLiteral("Module %1  (%2)").arg(Text(Number(module, "MOD")), Text(port.model)),
                              "paramedit.ModulePanel");
    item(port.path, m, QStringLiteral("Port %1  %2").arg(Text(Number(port.path, "CONN")), QLatin1String(PortKind(port))),
         PortPanel(port));
  }
  return 0;
}

bool ParameditParamEdWin::SelectPath(const Dstring& path) {
  for (QTreeWidgetItemIterator it(mTree); *it != nullptr; ++it) {
    if ((*it)->data(0, kPathRole).toString() == Text(path)) {
      mTree->setCurrentItem(*it);
      return true;
    }
  }
  return false;
}

QWidget* ParameditParamEdWin::CurrentPanel() const { return mBound; }

QWidget* ParameditParamEdWin::ShownPage() const { return mStack->currentWidget(); }

void ParameditParamEdWin::ShowLock(bool locked) {
  mLocked = locked;
  for (const auto& [resource, panel] : mPanels) panel->setEnabled(!locked);
  // The item chosen meanwhile is read now.
  if (!locked && mStack->currentWidget() == mUnread) NfySelectionChanged();
}

void ParameditParamEdWin::NfySelectionChanged() {
  const QList<QTreeWidgetItem*> selected = mTree->selectedItems();
  if (selected.isEmpty()) return;
  ConditionList list;
  {
    WaitCursor wait;
    QStringList path;
    for (const QTreeWidgetItem* at = selected.first(); at != nullptr; at = at->parent()) path.prepend(at->text(0).simplified());
    mTitle->setText(path.join(QStringLiteral("  \u203A  ")));
    const int status = ShowItem(selected.first()->data(0, kPathRole).toString().toStdString(),
                                selected.first()->data(0, kPanelRole).toString().toStdString(), list);
    if (status == QenStatus::kLocked) {
      mUnread->setText(QStringLiteral("Another client holds the instrument: the values of %1 are read once it lets go.")
                           .arg(path.join(QStringLiteral(" \u203A "))));
      mStack->setCurrentWidget(mUnread);
    }
  }
  BoundControl::Report(list);
}

QWidget* ParameditParamEdWin::Panel(const Dstring& resource, ConditionList& list) {
  auto found = mPanels.find(resource);
  if (found != mPanels.end()) return found->second;
  QWidget* panel = ResourceLibrary::Load(resource, mStack, list);
  if (panel != nullptr) {
    // The labels of every group share one width, so that the fields line up down the panel.
    for (auto* grid : panel->findChildren<QGridLayout*>()) grid->setColumnMinimumWidth(0, 130);
    panel->setEnabled(!mLocked);
    mStack->addWidget(panel);
    mPanels[resource] = panel;
  }
  return panel;
}

int ParameditParamEdWin::ShowItem(const Dstring& path, const Dstring& panelResource, ConditionList& list) {
  QWidget* panel = Panel(panelResource, list);
  if (panel == nullptr) return 1;
  const Dstring base = ":" + QenGuiInst::GetAppHandle() + path;
  std::set<Dstring> headers;
  int status = ReadHeaders(base, headers, list);
  // Held by another client nothing can be read: the panel stays with the item it shows.
  if (status == QenStatus::kLocked) return status;
  // A panel left behind lets go of its parameters, so that the poll no longer reads them.
  if (mBound != nullptr && mBound != panel) BoundControl::SetDsBaseNameAll(mBound, "", list);
  if (status == 0) ShowRows(panel, base, headers);
  auto exists = [&headers](const Dstring& name) { return headers.contains(name.ToUpper()); };
  if (int rc = BoundControl::SetDsBaseNameAll(panel, base, list, exists); status == 0) status = rc;
  ShowMemory(panel, base, headers);
  mStack->setCurrentWidget(panel);
  mBound = panel;
  return status;
}

int ParameditParamEdWin::ReadHeaders(const Dstring& base, std::set<Dstring>& headers, ConditionList& list) {
  Dstring reply;
  if (int status = QenGuiInst::Call(":L" + base + "?", reply, list)) return status;
  DataParcel items;
  if (ParserExpression::Parse(reply, items, list) != 0) return 1;
  for (const DataItem& item : items) headers.insert(Dstring(item.GetText()).ToUpper());
  return 0;
}

// Hides each control (and the label of its row) whose parameter the item does not have.
void ParameditParamEdWin::ShowRows(QWidget* panel, const Dstring& base, const std::set<Dstring>& headers) {
  for (BoundControl* control : BoundControl::FindAll(panel)) {
    auto* widget = dynamic_cast<QWidget*>(control);
    const bool present = headers.contains(Dstring(base + control->Binding().GetDsCmdName()).ToUpper());
    widget->setVisible(present);
    auto* grid = qobject_cast<QGridLayout*>(widget->parentWidget()->layout());
    const int index = grid != nullptr ? grid->indexOf(widget) : -1;
    if (index < 0) continue;
    int row = 0, column = 0, rowSpan = 0, columnSpan = 0;
    grid->getItemPosition(index, &row, &column, &rowSpan, &columnSpan);
    if (QLayoutItem* label = grid->itemAtPosition(row, 0); label != nullptr && label->widget() != widget) {
      label->widget()->setVisible(present);
    }
  }
}

void ParameditParamEdWin::ShowMemory(QWidget* panel, const Dstring& base, const std::set<Dstring>& headers) {
  auto* label = panel->findChild<QLabel*>(QStringLiteral("LabelMemory"));
  if (label == nullptr) return;
  const Dstring header = base + ":MEM:DEPT";
  Dstring reply;
  ConditionList ignored;
  unsigned long bits = 0;
  if (!headers.contains(header.ToUpper()) || QenGuiInst::Call(header + "?", reply, ignored) != 0 ||
      !reply.Trimmed().ToULong(bits)) {
    label->setText(QStringLiteral("none"));
    return;
  }
  Dstring number;
  Dstring unit;
  FormatMemory(bits, number, unit);
  label->setText(QStringLiteral("%1 %2").arg(Text(number), Text(unit)));
}
