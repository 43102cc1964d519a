#include "windows/RefusalText.h"

#include <QAbstractButton>
#include <QApplication>
#include <QGridLayout>
#include <QLabel>
#include <QRegularExpression>
#include <cmath>
#include <optional>
#include <string_view>
#include <vector>

#include "core/uiapp.h"
#include "data/Dte.h"
#include "data/QenParamDs.h"
#include "data/RunStopDs.h"
#include "instrument/QenGuiInst.h"
#include "params/UnitsRecord.h"
#include "params/ValueText.h"
#include "params/ui/BoundControl.h"
#include "support/FWBlocker.h"
#include "support/ParserExpression.h"
#include "windows/common/PlaceName.h"

namespace {

struct Named {
  const char* path;  // after the handle, upper case
  const char* args;  // upper case, empty for none
  const char* name;
};

constexpr Named kNamed[] = {
    {":SGEN:GLOB:INIT:CONT", "ON", "Run"},         {":SGEN:GLOB:INIT:CONT", "OFF", "Stop"},
    {":SGEN:GLOB:SEQ:FORC", "", "Sequence force"}, {":SGEN:GLOB:CONN", "ON", "Outputs on"},
    {":SGEN:GLOB:CONN", "OFF", "Outputs off"},     {":SYST:TEST:STAR", "", "Self test"},
    {":SYST:DESK:STAR", "", "Deskew"},
};

QString Text(const Dstring& text) { return QString::fromStdString(text); }

// The label on the row of `widget` in its grid, or the text of a button that carries its own.
QString RowLabel(QWidget* widget) {
  QWidget* parent = widget->parentWidget();
  if (auto* grid = qobject_cast<QGridLayout*>(parent != nullptr ? parent->layout() : nullptr)) {
    int row = 0, column = 0, rowSpan = 0, columnSpan = 0;
    if (const int index = grid->indexOf(widget); index >= 0) {
      grid->getItemPosition(index, &row, &column, &rowSpan, &columnSpan);
      QLayoutItem* item = column > 0 ? grid->itemAtPosition(row, 0) : nullptr;
      if (auto* label = item != nullptr ? qobject_cast<QLabel*>(item->widget()) : nullptr) return label->text().remove(QLatin1Char('&'));
    }
  }
  if (auto* button = qobject_cast<QAbstractButton*>(widget)) return button->text().remove(QLatin1Char('&'));
  return {};
}

// The label under which a window shows the parameter `name`, if one does.
QString LabelOf(const Dstring& name) {
  const Dstring wanted = name.ToUpper();
  for (QWidget* widget : QApplication::allWidgets()) {
    auto* control = dynamic_cast<BoundControl*>(widget);
    if (control == nullptr || control->GetDsName().ToUpper() != wanted) continue;
    if (QString label = RowLabel(widget); !label.isEmpty()) return label;
  }
  return {};
}

// The unit the parameter's field shows, when it has one.
std::optional<UnitsRecord> UnitsOf(const Dstring& name) {
  QenParamDs* attr = Dte::GetDsByName(name + ":ATTR");
  Dstring reply;
  ConditionList ignored;
  UnitsRecord units;
  if (attr == nullptr || attr->QueryStrValue(reply, ignored) != 0 || units.Parse(reply, ignored) != 0 ||
      units.curExp == UnitsRecord::kExpNotSet) {
    return std::nullopt;
  }
  return units;
}

QString Shown(double value, const std::optional<UnitsRecord>& units) {
  if (!units) return QString::number(value, 'g', 12);
  return Text(ValueText::FormatDisplay(value, units->curExp) + " " + units->LabelText().Trimmed());
}

// "Group 1 › Module 1 › Port 1 · Amplitude: 7 V asked; the instrument takes 0.1 V to 5 V."
QString DescribeParameter(QenParamDs* source, const Dstring& path, const Dstring& args) {
  const Dstring name = source->GetProgramHeader();
  const QString place = PlaceName(path);
  QString label = LabelOf(name);
  if (label.isEmpty()) {
    // The words after the place: ":CGR1:MOD1:CONN1:VOLT:AMPL" → "VOLT:AMPL".
    static const QRegularExpression kPlace(QStringLiteral("^(CGR|MOD|CONN)\\d+$"));
    QStringList words = Text(path).split(QLatin1Char(':'), Qt::SkipEmptyParts);
    while (!words.isEmpty() && kPlace.match(words.first()).hasMatch()) words.removeFirst();
    label = words.join(QLatin1Char(':'));
  }
  const QString what = place.isEmpty() ? label : place + QStringLiteral(" \u00B7 ") + label;
  const double asked = ValueText::ReadReplyNumber(args);
  if (std::isnan(asked)) return QStringLiteral("%1: %2 asked.").arg(what, Text(args));
  const std::optional<UnitsRecord> units = UnitsOf(name);
  QString text = QStringLiteral("%1: %2 asked").arg(what, Shown(asked, units));
  Dstring low;
  Dstring high;
  ConditionList ignored;
  FWBlocker guard("RefusalText::Describe", ignored);
  if (guard.Block() == 0 && source->QueryLLimStrValue(low, ignored) == 0 && source->QueryHLimStrValue(high, ignored) == 0) {
    const double lowest = ValueText::ReadReplyNumber(low);
    const double highest = ValueText::ReadReplyNumber(high);
    if (!std::isnan(lowest) && !std::isnan(highest)) {
      text += QStringLiteral("; the instrument takes %1 to %2").arg(Shown(lowest, units), Shown(highest, units));
    }
  }
  return text + QLatin1Char('.');
}

QString DescribeNamed(const Named& named) {
  if (std::string_view(named.path) == ":SYST:TEST:STAR") {
    ConditionList ignored;
    RunStopDs* run = uiapp::GetRunStopDs();
    // The state is asked anew: the poll may not have seen a start by another client yet.
    if (run != nullptr && run->UpdateFromFW(ignored) == 0 && run->IsRunning()) {
      return QStringLiteral("Self test: the self test cannot start while the instrument runs.");
    }
  }
  return QStringLiteral("%1 was refused.").arg(QLatin1String(named.name));
}

// One command of a frame: "<handle><path> <args>".
QString DescribeCommand(std::string_view command) {
  Dstring text = Dstring(command).Trimmed();
  const std::size_t blank = text.find_first_of(" \t");
  Dstring header(text.substr(0, blank));
  const Dstring args = blank == Dstring::npos ? Dstring() : Dstring(text.substr(blank + 1)).Trimmed();
  const Dstring handle = ":" + QenGuiInst::GetAppHandle().ToUpper() + ":";
  if (!header.StartsWith(":")) header = ":" + header;
  if (!header.ToUpper().StartsWith(handle)) return QStringLiteral("The instrument refused %1.").arg(Text(text));
  const Dstring path(header.substr(handle.size() - 1));
  for (const Named& named : kNamed) {
    if (path.ToUpper() == named.path && args.ToUpper() == named.args) return DescribeNamed(named);
  }
  if (QenParamDs* source = Dte::GetDsByName(header); source != nullptr && !path.EndsWith("?")) {
    return DescribeParameter(source, path, args);
  }
  return QStringLiteral("The instrument refused %1.").arg(Text(path + (args.empty() ? "" : " " + args)));
}

}  // namespace

void RefusalText::Install() { QenGuiInst::SetRefusalDescriber(&RefusalText::Describe); }

void RefusalText::Uninstall() { QenGuiInst::SetRefusalDescriber(nullptr); }

Dstring RefusalText::Describe(const Condition& condition) {
  std::vector<std::string_view> parts;
  ConditionList ignored;
  if (ParserExpression::SplitJoined(condition.GetCommand(), parts, ignored) != 0) return {};
  QStringList lines;
  for (std::string_view part : parts) {
    if (!Dstring(part).Trimmed().empty()) lines << DescribeCommand(part);
  }
  return lines.join(QLatin1Char('\n')).toStdString();
}
