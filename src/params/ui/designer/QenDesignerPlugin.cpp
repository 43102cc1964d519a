#include "QenDesignerPlugin.h"

#include "DesignerWidget.h"
#include "params/DsBinding.h"
#include "params/ui/LbUnitEd.h"
#include "params/ui/QenDsCBox.h"
#include "params/ui/QenDsCBut.h"
#include "params/ui/QenDsRBut.h"
#include "params/ui/QenDsSTEd.h"
#include "params/ui/QenDsSlidr.h"
#include "params/ui/QenParEd.h"
#include "params/ui/QenParLb.h"
#include "params/ui/UnitEd.h"

namespace {

template <class T>
QDesignerCustomWidgetInterface* Widget(const char* name, const char* tip) {
  return new DesignerWidget(QString::fromLatin1(name), QStringLiteral("params/ui/%1.h").arg(QLatin1String(name)),
                            QString::fromLatin1(tip), [](QWidget* parent) { return new T(parent); });
}

}  // namespace

QenDesignerPlugin::QenDesignerPlugin(QObject* parent) : QObject(parent) {
  DsBinding::SetDesignMode(true);
  mWidgets = {
      Widget<QenDsCBut>("QenDsCBut", "Check button bound to a parameter (OnValue / OffValue)"),
      Widget<QenDsRBut>("QenDsRBut", "Radio button bound to a parameter (OnValue)"),
      Widget<QenDsCBox>("QenDsCBox", "Combo box bound to a parameter; items \"#1e-9=1 ns\" or \"$SEQ=Sequence\""),
      Widget<QenDsSlidr>("QenDsSlidr", "Slider bound to a numeric parameter (Denominator1/2)"),
      Widget<QenDsSTEd>("QenDsSTEd", "Text field bound to a parameter"),
      Widget<QenParEd>("QenParEd", "Numeric parameter field with its unit label"),
      Widget<QenParLb>("QenParLb", "Numeric parameter field of a list, with its unit label"),
      Widget<UnitEd>("UnitEd", "Unit label of a parameter field"),
      Widget<LbUnitEd>("LbUnitEd", "Unit label of a list parameter field"),
  };
}

QenDesignerPlugin::~QenDesignerPlugin() { qDeleteAll(mWidgets); }
