#pragma once

#include <map>
#include <string>

// The sigrok command-line tool, when it is installed, reading a Value Change Dump as its VCD
// input does: what a logic analyser program makes of a file the product wrote.
class SigrokCli {
 public:
  static bool IsInstalled();
  // The samples of every channel, one '0' or '1' a sample, by channel name ("d0", "bus[3]").
  // `options` go to the input ("downsample=1000"). False, with the tool's output in `error`,
  // when it failed or printed no samples.
  static bool Read(const std::string& path, const std::string& options,
                   std::map<std::string, std::string>& channels, std::string& error);
};
