#include "params/UnitMenu.h"

#include <cmath>

Dstring UnitMenu::PrefixItemLabel(int index, const UnitsRecord& units) {
  return Dstring::Format("%c%s", kPrefixLetters[index], units.unitName.c_str());
}

int UnitMenu::CheckedStepItemId(double step) {
  return static_cast<int>(std::floor(std::log10(step) + kStepMenu + 0.5));
}

Dstring UnitMenu::StepItemLabel(int id) { return Dstring::Format("%g", std::pow(10.0, id - kStepMenu)); }

bool UnitMenu::Apply(int id, UnitsRecord& units) {
  if (id >= 51 && id <= 149) {
    units.curExp = id - kPrefixMenu;
    return true;
  }
  if (id >= 151 && id <= 249) {
    units.step = std::pow(10.0, id - kStepMenu);
    return true;
  }
  return false;
}
