#include "HostOptions.h"

#include <cctype>

#include "core/uiapp.h"
#include "support/ConditionListLoader.h"
#include "support/Dstring.h"

namespace {

// HOST, HOST:PORT, [V6] or [V6]:PORT; a bare host takes the server's default port. A form
// with several colons and no brackets is an IPv6 address followed by its port.
int ParseAddress(const std::string& text, HostOptions& out, ConditionList& list) {
  std::string host = text;
  std::string portText;
  if (text.starts_with('[')) {
    const auto close = text.find(']');
    const bool tail = close != std::string::npos && close + 1 < text.size();
    if (close == std::string::npos || close == 1 || (tail && text[close + 1] != ':')) host.clear();
    if (!host.empty()) host = text.substr(1, close - 1);
    if (tail) portText = text.substr(close + 2);
    if (tail && portText.empty()) host.clear();
  } else if (const auto colon = text.rfind(':'); colon != std::string::npos) {
    host = text.substr(0, colon);
    portText = text.substr(colon + 1);
    if (portText.empty()) host.clear();
  }
  unsigned long port = HostOptions::kDefaultPort;
  if (host.empty() || (!portText.empty() && (!Dstring(portText).ToULong(port) || port == 0 || port > 65535))) {
    ConditionListLoader::ConditionToken(list, "GUI_INSTRUMENT_BAD_ADDRESS", {Dstring(text)});
    return 1;
  }
  out.host = host;
  out.port = static_cast<unsigned short>(port);
  return 0;
}

// A parameter header after the handle, as ":TRIG:MODE" (the leading colon may be left out):
// nothing that could end the command. Returns it with its colon, or empty when it is none.
std::string WatchHeader(const std::string& text) {
  const std::string header = text.starts_with(':') ? text : ":" + text;
  if (header.size() < 2 || header[1] == ':') return {};
  for (char c : header) {
    if (!std::isalnum(static_cast<unsigned char>(c)) && c != ':' && c != '_') return {};
  }
  return header;
}

int ParseSize(const std::string& text, HostOptions& out) {
  const auto x = text.find('x');
  unsigned long w = 0, h = 0;
  if (x == std::string::npos || !Dstring(text.substr(0, x)).ToULong(w) || !Dstring(text.substr(x + 1)).ToULong(h) ||
      w < 200 || h < 150 || w > 8192 || h > 8192) {
    return 1;
  }
  out.width = static_cast<int>(w);
  out.height = static_cast<int>(h);
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
    } else if (a == "--version") {
      out.mode = Mode::Version;
    } else if (a == "--simulate") {
      out.simulate = haveServer = true;
    } else if (a == "--console") {
      out.mode = Mode::Console;
      if (hasValue && !args[i + 1].starts_with("--")) {
        if (ParseAddress(args[++i], out, list) != 0) return 1;
        haveServer = true;
      }
    } else if (a == "--headless") {
      out.mode = Mode::Headless;
      if (hasValue && !args[i + 1].starts_with("--")) {
        if (ParseAddress(args[++i], out, list) != 0) return 1;
        haveServer = true;
      }
    } else if (a == "--watch" && hasValue) {
      const std::string header = WatchHeader(args[i + 1]);
      if (header.empty()) return Bad(list, a + " " + args[i + 1]);
      out.watch.push_back(header);
      ++i;
    } else if (a == "--seconds" && hasValue) {
      double seconds = 0;
      if (!Dstring(args[++i]).ToDouble(seconds) || seconds <= 0) return Bad(list, a + " " + args[i]);
      out.seconds = seconds;
    } else if (a == "--reply-timeout" && hasValue) {
      double seconds = 0;
      if (!Dstring(args[++i]).ToDouble(seconds) || seconds <= 0 || seconds > 86400) return Bad(list, a + " " + args[i]);
      out.replyTimeout = seconds;
    } else if (a == "--resource" && hasValue) {
      out.resource = args[++i];
    } else if (a == "--log-dir" && hasValue) {
      out.logDir = args[++i];
    } else if (a == "--param-set" && hasValue) {
      unsigned long set = 0;
      if (!Dstring(args[++i]).ToULong(set)) return Bad(list, a + " " + args[i]);
      out.paramSet = set;
    } else if (a == "--screenshot" && hasValue) {
      out.screenshot = args[++i];
    } else if (a == "--open" && hasValue) {
      out.open.push_back(args[++i]);
    } else if (a == "--size" && hasValue) {
      if (ParseSize(args[++i], out) != 0) return Bad(list, a + " " + args[i]);
    } else if (!a.starts_with("--") && !haveServer) {
      if (ParseAddress(a, out, list) != 0) return 1;
      haveServer = true;
    } else {
      return Bad(list, a);
    }
  }
  // Only the window asks for a server; the others, and a screenshot, take the simulator.
  if (!haveServer && out.mode == Mode::Gui && out.screenshot.empty()) {
    out.askServer = true;
  } else if (!haveServer && out.mode != Mode::Help && out.mode != Mode::Version) {
    out.simulate = true;
  }
  return 0;
}

std::string HostOptions::Usage() {
  std::string windows;
  for (const WindowResource& entry : uiapp::WindowResources()) {
    if (entry.onMenu) windows += "                         " + entry.resource + " (" + entry.title + ")\n";
  }
  return "usage: qengui [HOST[:PORT] | --simulate] [--console | --headless | --screenshot FILE] [options]\n"
         "  HOST[:PORT]          the instrument server, port 7130 when none is given (the window asks\n"
         "                       when no server is given); [V6ADDR]:PORT for an IPv6 address\n"
         "  --console [ADDR]     command console instead of the window: one output line per input line\n"
         "                       (OK, the reply, or ERROR code,\"text\"); exit code 1 when a command failed\n"
         "  --headless [ADDR]    run the application without a display: poll the server and print\n"
         "                       every change of its state and of the watched parameters, timestamped\n"
         "  --watch HEADER       with --headless: also print this parameter (header without the\n"
         "                       handle, e.g. :TRIG:MODE or TRIG:MODE); may be given several times;\n"
         "                       a header the instrument does not know ends the host with code 2\n"
         "  --seconds N          with --headless: end after N seconds (else on SIGINT or SIGTERM)\n"
         "  --simulate           start a private qensim on a free loopback port (the default of\n"
         "                       --console, --headless and --screenshot)\n"
         "  --screenshot FILE    start, poll once, write a PNG of the main window and end\n"
         "  --open RESOURCE      with --screenshot: open this window first; may be given several\n"
         "                       times. The windows:\n" +
         windows +
         "  --size WxH           with --screenshot: the main window's size (1280x800)\n"
         "  --resource NAME      instrument resource name the application handle is made from (QEN1)\n"
         "  --reply-timeout S    how long a reply is awaited, in seconds (else QEN_REPLY_TIMEOUT, or 30)\n"
         "  --log-dir DIR        directory of qengui.log (else QEN_LOG_DIR)\n"
         "  --param-set N        configuration parameter set (else QEN_CONFIG_PARAM_SET)\n"
         "  --version            print the version and end\n"
         "  --help, -h           this text\n";
}
