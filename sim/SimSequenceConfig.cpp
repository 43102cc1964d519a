#include "SimSequenceConfig.h"

#include <cctype>
#include <set>

namespace {

// The length of the ":CGRn:MODm:CONNk" at the start of `header`; 0 when it is not there.
std::size_t PortPrefix(const Dstring& header) {
  std::size_t at = 0;
  for (std::string_view word : {":CGR", ":MOD", ":CONN"}) {
    if (header.compare(at, word.size(), word) != 0) return 0;
    at += word.size();
    const std::size_t digits = at;
    while (at < header.size() && std::isdigit(static_cast<unsigned char>(header[at]))) ++at;
    if (at == digits) return 0;
  }
  return at < header.size() && header[at] == ':' ? at : 0;
}

// A value as the table replies it, without the quotes of a string.
Dstring Unquoted(const SimParam& param) {
  Dstring text = param.FormatValue();
  if (text.size() >= 2 && text.front() == '"' && text.back() == '"')
    text = Dstring(text.substr(1, text.size() - 2));
  return text;
}

bool Has(const SimParamTable& params, const Dstring& header) {
  std::size_t index = 0;
  return params.Find(header, index);
}

Dstring Quoted(const Dstring& text) {
  return "\"" + text + "\"";
}

}  // namespace

SimSequenceConfig::SimSequenceConfig(const SimParamTable& params) {
  std::size_t index = 0;
  if (params.Find(":CENT:TYPE", index)) mCentral = Unquoted(params.At(index));
  if (params.Find(":MEAS:MODE", index)) mModeIndex = index;
  std::set<Dstring> seen;
  for (std::size_t i = 0; i < params.Size(); ++i) {
    const Dstring& header = params.At(i).GetHeader();
    const std::size_t length = PortPrefix(header);
    if (length == 0 || !seen.insert(header.substr(0, length)).second) continue;
    Port port;
    port.path = header.substr(0, length);
    const bool clock = Has(params, port.path + ":DIV");
    port.portClass = clock ? "PCLK" : "PDAT";
    port.type = !clock && Has(params, port.path + ":VOLT:THR") ? "INPUT_PORT" : "OUTPUT_PORT";
    const std::size_t module = port.path.rfind(":CONN");
    if (params.Find(port.path.substr(0, module) + ":TYPE", index)) port.model = Unquoted(params.At(index));
    mPorts.push_back(std::move(port));
  }
}

unsigned long SimSequenceConfig::NumDataPorts() const {
  unsigned long n = 0;
  for (const Port& port : mPorts) n += port.portClass == "PDAT";
  return n;
}

Dstring SimSequenceConfig::Mode(const SimParamTable& params) const {
  return mModeIndex < params.Size() ? Unquoted(params.At(mModeIndex)) : Dstring("PATT");
}

Dstring SimSequenceConfig::Format(const SimParamTable& params) const {
  Dstring out = Quoted(Mode(params)) + "," + Quoted(mCentral);
  for (const Port& port : mPorts) {
    out += ",(" + Quoted(port.path) + "," + Quoted(port.portClass) + "," + Quoted(port.type) + "," +
           Quoted(port.model) + ")";
  }
  return out;
}
