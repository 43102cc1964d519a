#include "params/ui/BoundControlClasses.h"

#include "params/ui/LbUnitEd.h"
#include "params/ui/QenDsCBox.h"
#include "params/ui/QenDsCBut.h"
#include "params/ui/QenDsRBut.h"
#include "params/ui/QenDsSTEd.h"
#include "params/ui/QenDsSlidr.h"
#include "params/ui/QenParEd.h"
#include "params/ui/QenParLb.h"
#include "params/ui/UnitEd.h"
#include "toolkit/qt/WidgetClassTable.h"

namespace {

template <class T>
void Offer(const char* name) {
  WidgetClassTable::AddFactory(name, [](QWidget* parent) -> QWidget* { return new T(parent); });
}

}  // namespace

void BoundControlClasses::AddFactories() {
  Offer<UnitEd>("UnitEd");
  Offer<LbUnitEd>("LbUnitEd");
  Offer<QenDsCBut>("QenDsCBut");
  Offer<QenDsRBut>("QenDsRBut");
  Offer<QenDsCBox>("QenDsCBox");
  Offer<QenDsSlidr>("QenDsSlidr");
  Offer<QenDsSTEd>("QenDsSTEd");
  Offer<QenParEd>("QenParEd");
  Offer<QenParLb>("QenParLb");
}
