#include "common/SigrokCli.h"

#include <cstdio>
#include <cstdlib>
#include <memory>

bool SigrokCli::IsInstalled() {
  return std::system("command -v sigrok-cli >/dev/null 2>&1") == 0;
}

bool SigrokCli::Read(const std::string& path, const std::string& options,
                     std::map<std::string, std::string>& channels, std::string& error) {
  channels.clear();
  error.clear();
  // One line a channel ("name:0101 1100 …"), however long.
  const std::string command = "sigrok-cli -I 'vcd" + (options.empty() ? "" : ":" + options) + "' -i '" +
                              path + "' -O bits:width=0 2>&1";
  std::unique_ptr<FILE, int (*)(FILE*)> pipe(popen(command.c_str(), "r"), pclose);
  if (!pipe) {
    error = "sigrok-cli could not be started";
    return false;
  }
  std::string output;
  char chunk[65536];
  for (std::size_t n; (n = std::fread(chunk, 1, sizeof chunk, pipe.get())) > 0;) output.append(chunk, n);
  const int status = pclose(pipe.release());
  std::size_t start = 0;
  while (start < output.size()) {
    std::size_t end = output.find('\n', start);
    if (end == std::string::npos) end = output.size();
    const std::string line = output.substr(start, end - start);
    start = end + 1;
    const std::size_t colon = line.rfind(':');
    // "META samplerate: …" and the like have a blank after the colon.
    if (colon == std::string::npos || colon + 1 >= line.size() ||
        (line[colon + 1] != '0' && line[colon + 1] != '1'))
      continue;
    std::string bits;
    bool samples = true;
    for (char c : line.substr(colon + 1)) {
      if (c == '0' || c == '1')
        bits += c;
      else
        samples = samples && c == ' ';
    }
    if (samples && !bits.empty()) channels[line.substr(0, colon)] += bits;
  }
  if (status != 0 || channels.empty()) {
    error = command + "\n" + output;
    return false;
  }
  return true;
}
