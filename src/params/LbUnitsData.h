#pragma once

#include "params/UnitsRecord.h"

// The unit attribute record of a list-box parameter field (QenParLb).
class LbUnitsData : public UnitsRecord {};
