#include "data/ErrStateGridModel.h"

#include <algorithm>

#include "support/NumberText.h"

Dstring ErrStateGridModel::CountText(unsigned long long count) {
  if (count < 10000) return NumberText::Grouped(count);
  static const char kUnits[] = "kMGTPE";
  auto value = static_cast<double>(count);
  int unit = -1;
  while (value >= 999.5 && unit < 5) {
    value /= 1000;
    ++unit;
  }
  const int decimals = value < 9.995 ? 2 : value < 99.95 ? 1 : 0;
  return Dstring::Format("%.*f%c", decimals, value, kUnits[unit]);
}

void ErrStateGridModel::SetResults(const std::vector<BerSvr::PortResult>& results) {
  mResults = results;
  mLine = std::clamp(mLine, 0L, std::max(0L, Lines() - 1));
  mChannel = std::clamp(mChannel, 0L, std::max(0L, ChannelsOf(mLine) - 1));
}

long ErrStateGridModel::ChannelsOf(long line) const {
  if (line < 0 || line >= Lines()) return 0;
  return static_cast<long>(mResults[static_cast<std::size_t>(line)].channels.size());
}

long ErrStateGridModel::MostChannels() const {
  long most = 0;
  for (long line = 0; line < Lines(); ++line) most = std::max(most, ChannelsOf(line));
  return most;
}

bool ErrStateGridModel::HasErrors(long line) const {
  return line >= 0 && line < Lines() && mResults[static_cast<std::size_t>(line)].errors > 0;
}

void ErrStateGridModel::SetChannelOffset(long first) {
  mChannelOffset = std::clamp(first, 0L, std::max(0L, MostChannels() - 1));
}

void ErrStateGridModel::SetCursor(long line, long channel, long channelsShown) {
  if (mResults.empty()) return;
  mLine = std::clamp(line, 0L, Lines() - 1);
  mChannel = std::clamp(channel, 0L, std::max(0L, ChannelsOf(mLine) - 1));
  const long shown = std::max(1L, channelsShown);
  if (mChannel < mChannelOffset) mChannelOffset = mChannel;
  if (mChannel >= mChannelOffset + shown) mChannelOffset = mChannel - shown + 1;
}

void ErrStateGridModel::PressKey(Key key, long linesShown, long channelsShown) {
  const long page = std::max(1L, linesShown - 1);
  long line = mLine;
  long channel = mChannel;
  switch (key) {
    case Key::kUp: --line; break;
    case Key::kDown: ++line; break;
    case Key::kLeft: --channel; break;
    case Key::kRight: ++channel; break;
    case Key::kHome: channel = 0; break;
    case Key::kEnd: channel = ChannelsOf(mLine) - 1; break;
    case Key::kPageUp: line -= page; break;
    case Key::kPageDown: line += page; break;
  }
  SetCursor(line, channel, channelsShown);
}
