#include "toolkit/qt/WidgetClassTable.h"

#include <map>
#include <set>

#include "support/ConditionListLoader.h"

namespace {

std::map<Dstring, WidgetClassTable::Factory>& Factories() {
  static std::map<Dstring, WidgetClassTable::Factory> factories;
  return factories;
}

std::set<Dstring>& Registered() {
  static std::set<Dstring> registered;
  return registered;
}

}  // namespace

void WidgetClassTable::AddFactory(const Dstring& className, Factory factory) {
  Factories()[className] = std::move(factory);
}

int WidgetClassTable::Register(const Dstring& className, ConditionList& list) {
  if (!Factories().contains(className)) {
    ConditionListLoader::ConditionToken(list, "GUI_CLASS_UNKNOWN", {className}, 1);
    return 1;
  }
  Registered().insert(className);
  return 0;
}

void WidgetClassTable::UnregisterAll() { Registered().clear(); }

bool WidgetClassTable::IsRegistered(const Dstring& className) { return Registered().contains(className); }

QWidget* WidgetClassTable::Create(const Dstring& className, QWidget* parent) {
  if (!IsRegistered(className)) return nullptr;
  return Factories()[className](parent);
}
