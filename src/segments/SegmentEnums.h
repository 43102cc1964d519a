#pragma once

// The enumerations of the segment interface. Their keywords and display texts are in
// SegmentKeywords.

// What produces a segment's data. kNone is what a segment without a known type reads as; it
// is sent as "MEM", like kMemory.
enum class SegmentType : int { kNone = 0, kMemory = 1, kPrbs = 2, kPrws = 3, kSfi5 = 4 };

enum class PRxSLogic : int { kNormal = 0, kInverted = 1 };

// The two extended kinds share the keyword "EXTENDED"; the extension ("_Which") tells them
// apart: a run of zeros or a run of ones made longer.
enum class PRxSSubType : int { kPure = 0, kErrored = 1, kDensity = 2, kExtendedZero = 3, kExtendedOne = 4 };

// The share of ones in the stream.
enum class PRxSDensity : int { k1of8 = 0, k1of4 = 1, k1of2 = 2, k3of4 = 3, k7of8 = 4 };

enum class VectorTrace : int { kVector = 0, kTrace = 1 };
enum class InsertMode : int { kBefore = 0, kAfter = 1 };
enum class FindDirection : int { kPrevious = 0, kNext = 1, kFirst = 2 };
// Mirroring a range: its traces swap places, or its vectors do.
enum class MirrorMode : int { kTrace = 0, kVector = 1 };
// Serialising: which trace of a vector goes out first.
enum class Direction : int { kLsbFirst = 0, kMsbFirst = 1 };
// Deleting: the states go and the rest closes up, or they are set to the first state.
enum class DeleteMode : int { kNormal = 0, kClear = 1 };

// How a grid writes vector addresses.
enum class AddrFormat : int { kDecimal = 0, kHex = 1 };
// How a grid shows a row's data: digits of the row's data format, or one state per trace.
enum class DigitDispMode : int { kDigits = 0, kStates = 1 };
// Where an error search goes from the cursor.
enum class ERR_DIR : int { kPrevious = 0, kNext = 1, kFirst = 2 };
