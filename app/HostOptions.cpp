#include "HostOptions.h"

#include "support/ConditionListLoader.h"
#include "support/Dstring.h"

namespace {

int ParseAddress(const std::string& text, HostOptions& out, ConditionList& list) {
  auto colon = text.rfind(':');
  unsigned long port = 0;
  if (colon == std::string::npos || colon == 0 || !Dstring(text.substr(colon + 1)).ToULong(port) || port == 0 ||
      port > 65535) {
    ConditionListLoader::ConditionToken(list, "GUI_INSTRUMENT_BAD_ADDRESS", {Dstring(text)});
    return 1;
  }
  out.host = text.substr(0, colon);
  out.port = static_cast<unsigned short>(port);
  return 0;
}

int Bad(ConditionList& list, const std::string& what) {
  list.Add(1, Dstring("Unknown or incomplete option: ") + what);
  return 1;
}

}  // namespace

int HostOptions::Parse(const std::vector<std::string>& args, HostOptions& out, ConditionList& list) {
  bool haveServer = false;
  for (std::size_t i = 0; i < args.size(); ++i) {
    const std::string& a = args[i];
    const bool hasValue = i + 1 < args.size();
    if (a == "--help" || a == "-h") {
      out.mode = Mode::Help;
    } else if (a == "--simulate") {
      out.simulate = haveServer = true;
    } else if (a == "--console" && hasValue) {
      if (ParseAddress(args[++i], out, list) != 0) return 1;
      haveServer = true;
    } else if (a == "--resource" && hasValue) {
      out.resource = args[++i];
    } else if (a == "--log-dir" && hasValue) {
      out.logDir = args[++i];
    } else if (a == "--param-set" && hasValue) {
      unsigned long set = 0;
      if (!Dstring(args[++i]).ToULong(set)) return Bad(list, a + " " + args[i]);
      out.paramSet = set;
    } else {
      return Bad(list, a);
    }
  }
  if (!haveServer && out.mode != Mode::Help) out.simulate = true;
  return 0;
}

const char* HostOptions::Usage() {
  return "usage: qengui [--console HOST:PORT | --simulate] [--resource NAME] [--log-dir DIR] [--param-set N]\n"
         "  --console HOST:PORT  talk to the instrument server at HOST:PORT\n"
         "  --simulate           start a private qensim on a free loopback port (the default)\n"
         "  --resource NAME      instrument resource name the application handle is made from (QEN1)\n"
         "  --log-dir DIR        directory of qengui.log (else QEN_LOG_DIR)\n"
         "  --param-set N        configuration parameter set (else QEN_CONFIG_PARAM_SET)\n";
}
