#include "windows/GridClasses.h"

#include "segments/ui/GridManager.h"
#include "windows/errstate/ErrStateGridManager.h"

void GridClasses::AddFactories() {
  GridManager::CppRegister();
  ErrStateGridManager::CppRegister();
}
