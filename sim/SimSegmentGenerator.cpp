#include "SimSegmentGenerator.h"

#include <algorithm>
#include <bit>

namespace {

struct Polynomial {
  const char* text;
  int n;
  int m;
};

// The maximal-length polynomials x^n + x^m + 1 of the usual bit error test sequences.
constexpr Polynomial kPolynomials[] = {
    {"2^7-1", 7, 6},   {"2^9-1", 9, 5},    {"2^10-1", 10, 7},  {"2^11-1", 11, 9},  {"2^15-1", 15, 14},
    {"2^20-1", 20, 3}, {"2^23-1", 23, 18}, {"2^29-1", 29, 27}, {"2^31-1", 31, 28},
};

struct Density {
  const char* text;
  int taps;   // bits combined
  bool isOr;  // or-ed (more ones) rather than and-ed
};

constexpr Density kDensities[] = {
    {"1/8", 3, false}, {"1/4", 2, false}, {"1/2", 1, false}, {"3/4", 2, true}, {"7/8", 3, true},
};

constexpr long kFrames = 16;
constexpr long kPayloadBits = 1024;

const Polynomial* FindPolynomial(const Dstring& text) {
  for (const Polynomial& p : kPolynomials) {
    if (text == p.text) return &p;
  }
  return nullptr;
}

const Density* FindDensity(const Dstring& text) {
  for (const Density& d : kDensities) {
    if (text == d.text) return &d;
  }
  return nullptr;
}

// Polynomials over GF(2) of degree below 32 as bit masks. c is the characteristic polynomial
// x^n + x^(n-m) + 1 of the recurrence, so that x^k mod c gives b[k] from b[0..n-1].
std::uint64_t MulMod(std::uint64_t a, std::uint64_t b, std::uint64_t c, int n) {
  std::uint64_t product = 0;
  for (int i = 0; i < n; ++i) {
    if ((b >> i) & 1u) product ^= a << i;
  }
  for (int d = 2 * n - 2; d >= n; --d) {
    if ((product >> d) & 1u) product ^= c << (d - n);
  }
  return product;
}

std::uint64_t PowMod(long k, std::uint64_t c, int n) {
  std::uint64_t result = 1, base = 2;  // 1 and x
  for (; k > 0; k >>= 1) {
    if (k & 1) result = MulMod(result, base, c, n);
    base = MulMod(base, base, c, n);
  }
  return result;
}

}  // namespace

bool SimSegmentGenerator::Configure(const Settings& settings) {
  const Polynomial* p = FindPolynomial(settings.polynomial);
  if (p == nullptr || FindDensity(settings.density) == nullptr) return false;
  mSettings = settings;
  mN = p->n;
  mM = p->m;
  mPeriod = (1L << mN) - 1;
  const bool extended = settings.kind == "EXTENDED";
  mStreamLength = mPeriod + (extended ? settings.number : 0);
  if (settings.kind == "ERRORED" && settings.errors > mStreamLength) return false;
  if (extended) {
    // The run of ones starts the unrotated sequence; the stream counts in rotated positions.
    const long start = settings.extendOnes ? 0 : ZeroRunStart();
    mRunStart = ((start - settings.rotation) % mPeriod + mPeriod) % mPeriod;
  }
  const long frame =
      static_cast<long>(settings.framingBits.size() + settings.headerBits.size()) + kPayloadBits;
  mLength = settings.framed ? kFrames * frame : mStreamLength;
  return true;
}

long SimSegmentGenerator::ZeroRunStart() const {
  const std::uint32_t all = (1u << mN) - 1, run = (1u << (mN - 1)) - 1;
  std::uint32_t reg = all;  // b[i-1] in bit 0
  std::uint32_t recent = 0;
  // No run of zeros can end before bit 2n-2: the first n bits are ones.
  for (long i = mN; i < mPeriod + mN; ++i) {
    const std::uint32_t bit = ((reg >> (mN - 1)) ^ (reg >> (mM - 1))) & 1u;
    reg = ((reg << 1) | bit) & all;
    recent = ((recent << 1) | bit) & run;
    if (i >= 2L * mN - 2 && recent == 0) return (i - (mN - 2)) % mPeriod;
  }
  return 0;
}

void SimSegmentGenerator::BaseBits(long from, long count, std::uint8_t* out) const {
  if (count <= 0) return;
  const std::uint64_t c = (1ull << mN) | (1ull << (mN - mM)) | 1ull;
  const long start = ((from + mSettings.rotation) % mPeriod + mPeriod) % mPeriod;
  // The first n bits by jumping there, the rest by the recurrence.
  std::uint64_t r = PowMod(start, c, mN);
  std::uint32_t reg = 0;
  for (int i = 0; i < mN; ++i) {
    const auto bit = static_cast<std::uint32_t>(std::popcount(r) & 1);
    reg = (reg << 1) | bit;
    if (i < count) out[i] = static_cast<std::uint8_t>(bit);
    r = MulMod(r, 2, c, mN);
  }
  const std::uint32_t all = (1u << mN) - 1;
  for (long i = mN; i < count; ++i) {
    const std::uint32_t bit = ((reg >> (mN - 1)) ^ (reg >> (mM - 1))) & 1u;
    reg = ((reg << 1) | bit) & all;
    out[i] = static_cast<std::uint8_t>(bit);
  }
}

void SimSegmentGenerator::DensityBits(long from, long count, std::uint8_t* out) const {
  const Density* d = FindDensity(mSettings.density);
  std::vector<std::uint8_t> base(static_cast<std::size_t>(count + d->taps - 1));
  BaseBits(from, static_cast<long>(base.size()), base.data());
  for (long i = 0; i < count; ++i) {
    std::uint8_t bit = base[static_cast<std::size_t>(i)];
    for (int t = 1; t < d->taps; ++t) {
      const std::uint8_t next = base[static_cast<std::size_t>(i + t)];
      bit = d->isOr ? (bit | next) : (bit & next);
    }
    out[i] = bit;
  }
}

void SimSegmentGenerator::ExtendedBits(long from, long count, std::uint8_t* out) const {
  const long z = mRunStart, n = mSettings.number;
  const auto fill = static_cast<std::uint8_t>(mSettings.extendOnes ? 1 : 0);
  const long before = std::clamp(z - from, 0L, count);
  BaseBits(from, before, out);
  const long inside = std::clamp(z + n - (from + before), 0L, count - before);
  std::fill(out + before, out + before + inside, fill);
  BaseBits(from + before + inside - n, count - before - inside, out + before + inside);
}

// Error j sits at ((2j + 1) * L) / (2E): evenly spread, none at the very start.
void SimSegmentGenerator::FlipErrors(long from, long count, std::uint8_t* out) const {
  const auto length = static_cast<std::uint64_t>(mStreamLength),
             errors = static_cast<std::uint64_t>(mSettings.errors);
  const std::uint64_t first = static_cast<std::uint64_t>(from) * errors / length;
  for (std::uint64_t j = first > 0 ? first - 1 : 0; j < errors; ++j) {
    const auto at = static_cast<long>(((2 * j + 1) * length) / (2 * errors));
    if (at >= from + count) break;
    if (at >= from) out[at - from] ^= 1u;
  }
}

void SimSegmentGenerator::StreamBits(long from, long count, std::uint8_t* out) const {
  const Dstring& kind = mSettings.kind;
  if (kind == "EXTENDED") {
    ExtendedBits(from, count, out);
  } else if (kind == "DENSITY") {
    DensityBits(from, count, out);
  } else {
    BaseBits(from, count, out);
  }
  if (kind == "ERRORED" && mSettings.errors > 0) FlipErrors(from, count, out);
  if (mSettings.inverted) std::for_each(out, out + count, [](std::uint8_t& bit) { bit ^= 1u; });
}

void SimSegmentGenerator::FramedBits(long from, long count, std::uint8_t* out) const {
  const long framing = static_cast<long>(mSettings.framingBits.size());
  const long header = static_cast<long>(mSettings.headerBits.size());
  const long frame = framing + header + kPayloadBits;
  for (long i = 0; i < count;) {
    const long f = (from + i) / frame, k = (from + i) % frame;
    if (k < framing + header) {
      const char bit = k < framing ? mSettings.framingBits[static_cast<std::size_t>(k)]
                                   : mSettings.headerBits[static_cast<std::size_t>(k - framing)];
      out[i++] = static_cast<std::uint8_t>(bit - '0');
      continue;
    }
    const long run = std::min(count - i, frame - k);
    Cyclic(f * kPayloadBits + (k - framing - header), run, out + i, false);
    i += run;
  }
}

void SimSegmentGenerator::Cyclic(long from, long count, std::uint8_t* out, bool framed) const {
  const long length = framed ? mLength : mStreamLength;
  from %= length;
  while (count > 0) {
    const long run = std::min(count, length - from);
    if (framed) {
      FramedBits(from, run, out);
    } else {
      StreamBits(from, run, out);
    }
    out += run;
    count -= run;
    from = 0;
  }
}

void SimSegmentGenerator::Bits(long from, long count, std::vector<std::uint8_t>& out) const {
  out.assign(static_cast<std::size_t>(std::max(0L, count)), 0);
  Cyclic(from, count, out.data(), mSettings.framed);
}
