#pragma once

#include "params/UnitsRecord.h"

// The unit attribute record of a parameter field (QenParEd).
class UnitsData : public UnitsRecord {};
