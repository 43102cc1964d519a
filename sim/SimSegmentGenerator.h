#pragma once

#include <cstdint>
#include <vector>

#include "support/Dstring.h"

// The data of the generated segment types, worked out on demand rather than stored, so that a
// PRBS 2^31-1 costs no memory. The base is the maximal-length sequence of a polynomial
// x^n + x^m + 1 (b[i] = b[i-n] xor b[i-m], started from n ones), rotated by `rotation` bits;
// on it the kind of stream:
// - PURE: the sequence itself.
// - ERRORED: `errors` bits flipped, spread evenly over the stream.
// - DENSITY: ones made rarer (1/4: b[i] and b[i+1]; 1/8: three bits anded) or more frequent
//   (3/4, 7/8: or-ed); 1/2 is the sequence itself.
// - EXTENDED: the longest run of zeros (n-1) or of ones (n) made `number` bits longer.
// then the logic (INVERTED flips every bit). SFI5 frames the stream: 16 frames, each the
// framing bits, the expansion header bits and the next 1024 bits of the stream.
class SimSegmentGenerator {
 public:
  struct Settings {
    Dstring polynomial = "2^7-1";
    bool inverted = false;
    Dstring kind = "PURE";    // PURE, ERRORED, DENSITY, EXTENDED
    bool extendOnes = false;  // EXTENDED: the run of ones, else the run of zeros
    long errors = 0;
    Dstring density = "1/2";
    long number = 0;
    long rotation = 0;
    bool framed = false;  // SFI5
    Dstring framingBits;  // '0'/'1' text
    Dstring headerBits;
  };

  // False when the settings make no stream (unknown polynomial, more errors than bits).
  bool Configure(const Settings& settings);
  long GetLength() const { return mLength; }
  // Bits `from` .. `from + count - 1` of the stream, repeated cyclically, one per entry.
  void Bits(long from, long count, std::vector<std::uint8_t>& out) const;

 private:
  // The stream before framing, for from + count <= mStreamLength.
  void StreamBits(long from, long count, std::uint8_t* out) const;
  void Cyclic(long from, long count, std::uint8_t* out, bool framed) const;
  // The rotated base sequence, cyclic in the period.
  void BaseBits(long from, long count, std::uint8_t* out) const;
  void DensityBits(long from, long count, std::uint8_t* out) const;
  void ExtendedBits(long from, long count, std::uint8_t* out) const;
  void FlipErrors(long from, long count, std::uint8_t* out) const;
  void FramedBits(long from, long count, std::uint8_t* out) const;
  // Where the run of n-1 zeros starts in the unrotated sequence.
  long ZeroRunStart() const;

  Settings mSettings;
  int mN = 7;
  int mM = 6;
  long mPeriod = 127;
  long mStreamLength = 127;
  long mLength = 127;
  long mRunStart = 0;  // EXTENDED: where the extra bits go, in rotated base positions
};
