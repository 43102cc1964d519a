#pragma once

#include <memory>

#include "sequences/InstanceInfo.h"

// The window tools (NDTools) that need no toolkit. The window functions (GetWinByName,
// CreateWinByName, QueryAllExistingInstances, CreateWinFromLispList) join this namespace in
// the window layer.
namespace NDTools {

// The record a stored list describes, for the tags "InstanceInfo", "PortInstanceInfo",
// "AnalyzerPortInstanceInfo" and "ParamInstanceInfo" (element 0); null for every other tag,
// so that segment and sequence windows are never recreated from a stored list.
std::unique_ptr<InstanceInfo> InstanceInfoFactory(const LispList* list);

}  // namespace NDTools
