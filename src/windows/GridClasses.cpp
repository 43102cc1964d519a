#include "windows/GridClasses.h"

#include "segments/ui/GridManager.h"

void GridClasses::AddFactories() { GridManager::CppRegister(); }
