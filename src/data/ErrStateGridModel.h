#pragma once

#include <vector>

#include "data/BerSvr.h"
#include "support/Dstring.h"
#include "toolkit/GridKey.h"

// What the error state grid shows, without a widget: a line per analyser port with its error
// count and a cell per channel with that channel's errors. The cursor is a port and a channel;
// it stays on them when new counts come, as far as they still exist, and the channels shown
// follow it when a port has more than fit.
class ErrStateGridModel {
 public:
  // A page moves one line less than are shown.
  using Key = GridKey;

  // The text of a count in a cell: whole up to 9,999, then to three figures with k, M, G, T.
  static Dstring CountText(unsigned long long count);

  void SetResults(const std::vector<BerSvr::PortResult>& results);
  const std::vector<BerSvr::PortResult>& GetResults() const { return mResults; }
  long Lines() const { return static_cast<long>(mResults.size()); }
  long ChannelsOf(long line) const;
  // The most channels any port has: the width of the channel columns.
  long MostChannels() const;
  bool HasErrors(long line) const;

  long CursorLine() const { return mLine; }
  long CursorChannel() const { return mChannel; }
  long ChannelOffset() const { return mChannelOffset; }
  void SetChannelOffset(long first);
  // Moves the cursor inside the ports and the port's channels; the channels shown follow it
  // (`channelsShown` of them fit).
  void SetCursor(long line, long channel, long channelsShown);
  void PressKey(Key key, long linesShown, long channelsShown);

 private:
  std::vector<BerSvr::PortResult> mResults;
  long mLine = 0;
  long mChannel = 0;
  long mChannelOffset = 0;
};
