#include "windows/GridClasses.h"

#include "segments/ui/GridManager.h"
#include "segments/ui/SegmentGridManager.h"
#include "sequences/ui/LoopGridManager.h"
#include "windows/errstate/ErrStateGridManager.h"

void GridClasses::AddFactories() {
  GridManager::CppRegister();
  ErrStateGridManager::CppRegister();
  SegmentGridManager::CppRegister();
  LoopGridManager::CppRegister();
}
