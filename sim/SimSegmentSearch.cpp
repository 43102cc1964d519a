#include "SimSegmentSearch.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <string_view>
#include <vector>

namespace {

constexpr std::string_view kZeroStates = "0nNkKlL";
constexpr std::string_view kOneStates = "1pPrRhH";
constexpr std::string_view kDontCareStates = "xX";
constexpr std::string_view kErroredStates = "kKrR";
constexpr std::string_view kDigits = "0123456789abcdef";

// What a state matches: a 0 bit, a 1 bit, any bit (don't-care) or none (Z).
enum Match : std::uint8_t { kZero = 0, kOne = 1, kAny = 2, kNone = 3 };

Match MatchOf(char state) {
  if (kDontCareStates.find(state) != std::string_view::npos) return kAny;
  if (kOneStates.find(state) != std::string_view::npos) return kOne;
  return kZeroStates.find(state) != std::string_view::npos ? kZero : kNone;
}

// The states of a segment as the searches see them, read straight from the rows of memory
// data (the search looks at up to a billion positions).
class StateReader {
 public:
  explicit StateReader(const SimSegment& segment)
      : mSegment(segment), mRows(segment.GetRows()), mMemory(!segment.IsGenerated()) {
    for (std::size_t n = 0; n < mMatch.size(); ++n) {
      const char state = n < segment.GetCoding().size() ? segment.GetCoding()[n] : '?';
      mMatch[n] = MatchOf(state);
      mErrored[n] = kErroredStates.find(state) != std::string_view::npos;
    }
  }
  Match MatchAt(long trace, long vector) const {
    return mMemory ? mMatch[Index(trace, vector)] : MatchOf(mSegment.StateAt(trace, vector));
  }
  bool IsErroredAt(long trace, long vector) const {
    return mMemory ? mErrored[Index(trace, vector)]
                   : kErroredStates.find(mSegment.StateAt(trace, vector)) != std::string_view::npos;
  }

 private:
  std::size_t Index(long trace, long vector) const {
    return std::min<std::size_t>(mRows.Get(trace, vector), mMatch.size() - 1);
  }
  const SimSegment& mSegment;
  const SimSegmentRows& mRows;
  bool mMemory;
  // A state number has at most four bits.
  std::array<Match, 16> mMatch{};
  std::array<bool, 16> mErrored{};
};

constexpr long kNotFound = -1;
constexpr long kStopped = -2;

// Walks the positions 0 .. total-1 in the search order and gives the first that `hit` accepts.
template <typename Hit>
long Walk(long total, const Dstring& direction, long start, const Hit& hit, const SimSegmentSearch::Step& progress) {
  if (total <= 0) return kNotFound;
  start = std::clamp(start, 0L, total - 1);
  for (long step = 0; step < total; ++step) {
    long at = step;
    if (direction == "NEXT") at = (start + 1 + step) % total;
    if (direction == "PREV") at = ((start - 1 - step) % total + total) % total;
    if (hit(at)) return at;
    if ((step + 1) % SimSegmentSearch::kStep == 0 && !progress(step + 1, total)) return kStopped;
  }
  return -1;
}

}  // namespace

bool SimSegmentSearch::ParsePattern(const Dstring& text, Dstring& bits) {
  Dstring digits = text.Trimmed();
  int per = 1;
  if (!digits.empty() && (digits.back() == 'H' || digits.back() == 'h')) per = 4;
  if (!digits.empty() && (digits.back() == 'O' || digits.back() == 'o')) per = 3;
  if (per > 1) digits.pop_back();
  if (digits.empty()) return false;
  bits.clear();
  for (char c : digits) {
    const char lower = static_cast<char>(c >= 'A' && c <= 'Z' ? c - 'A' + 'a' : c);
    const std::size_t value = kDigits.find(lower);
    if (lower != 'x' && (value == std::string_view::npos || value >= (1u << per))) return false;
    for (int b = per - 1; b >= 0; --b) bits += lower == 'x' ? 'x' : (((value >> b) & 1u) ? '1' : '0');
  }
  return true;
}

bool SimSegmentSearch::Find(const SimSegment& segment, const Dstring& bits, bool alongTraces,
                            const Dstring& direction, long trace, long vector, long& foundTrace,
                            long& foundVector, const Step& step) {
  const long width = segment.GetWidth(), length = segment.GetLength();
  const long n = static_cast<long>(bits.size());
  const long inner = alongTraces ? length : width;
  auto position = [&](long at, long& t, long& v) {
    t = alongTraces ? at / inner : at % inner;
    v = alongTraces ? at % inner : at / inner;
  };
  std::vector<Match> pattern;
  for (char bit : bits) pattern.push_back(bit == 'x' ? kAny : bit == '1' ? kOne : kZero);
  const StateReader states(segment);
  auto hit = [&](long at) {
    long t = 0, v = 0;
    position(at, t, v);
    if (alongTraces ? v + n > length : t + n > width) return false;
    for (long i = 0; i < n; ++i) {
      const Match want = pattern[static_cast<std::size_t>(alongTraces ? i : n - 1 - i)];
      const Match state = alongTraces ? states.MatchAt(t, v + i) : states.MatchAt(t + i, v);
      if (want != kAny && state != kAny && state != want) return false;
    }
    return true;
  };
  const long start = alongTraces ? trace * inner + vector : vector * inner + trace;
  const long at = Walk(width * length, direction, start, hit, step);
  foundTrace = foundVector = -1;
  if (at >= 0) position(at, foundTrace, foundVector);
  return at != kStopped;
}

bool SimSegmentSearch::FindError(const SimSegment& segment, const Dstring& direction, long trace, long vector,
                                 long& foundTrace, long& foundVector, const Step& step) {
  const long width = segment.GetWidth();
  foundTrace = foundVector = -1;
  if (segment.GetCoding().find_first_of(kErroredStates.data(), 0, kErroredStates.size()) == Dstring::npos)
    return true;
  const StateReader states(segment);
  auto hit = [&](long at) { return states.IsErroredAt(at % width, at / width); };
  const long at = Walk(width * segment.GetLength(), direction, vector * width + trace, hit, step);
  if (at == kStopped) return false;
  if (at >= 0) {
    foundTrace = at % width;
    foundVector = at / width;
  }
  return true;
}
